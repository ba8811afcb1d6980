// The letters of tick labels in a PNG: thin strokes, drawn without any font of the system.
#pragma once

#include <string_view>

class Raster;

/// The width of `text` in pixels at a digit height of `size` pixels. Known are the digits, ":", ".", the space, "ms",
/// "dB", the minus and the infinity sign; anything else has no width.
float labelWidth(std::string_view text, float size);

/// Draws it in the color of the axis, from `x` on, standing on `baseline`.
void drawLabel(Raster& raster, std::string_view text, float x, float baseline, float size);
