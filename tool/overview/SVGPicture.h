// A waveform picture as an SVG file.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/WaveformPicture.h"

#include <string>

/// The text of the SVG file. `title` may hold anything.
std::string svgOf(const WaveformPicture& picture, const PictureColors& colors, const std::string& title);
