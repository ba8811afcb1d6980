// A waveform picture as a PNG file.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/Raster.h"
#include "tool/overview/WaveformPicture.h"

#include <string>

/// The picture, antialiased.
Raster rasterOf(const WaveformPicture& picture);

/// The bytes of the PNG file. Throws Failure.
std::string pngOf(const WaveformPicture& picture, const PictureColors& colors);
