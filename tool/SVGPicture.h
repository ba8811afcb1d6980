// A waveform picture as an SVG file.
#pragma once

#include "PictureColors.h"
#include "WaveformPicture.h"

#include <string>

/// The text of the SVG file. `title` may hold anything.
std::string svgOf(const WaveformPicture& picture, const PictureColors& colors, const std::string& title);
