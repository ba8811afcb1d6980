// A waveform picture as a PNG file.
#pragma once

#include "PictureColors.h"
#include "Raster.h"
#include "WaveformPicture.h"

#include <string>

/// The picture, antialiased.
Raster rasterOf(const WaveformPicture& picture);

/// The bytes of the PNG file. Throws Failure.
std::string pngOf(const WaveformPicture& picture, const PictureColors& colors);
