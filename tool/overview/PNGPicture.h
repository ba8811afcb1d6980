// A waveform picture as a PNG file.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/Raster.h"
#include "tool/overview/WaveformPicture.h"

#include <string>

/// Draws the picture antialiased, with its corner at (x, y) in the picture's own pixels.
void drawPicture(Raster& raster, const WaveformPicture& picture, int x, int y);

/// The content of the PNG file. Throws Failure.
std::string pngOf(const WaveformPicture& picture, const PictureColors& colors);
