// Texts in a PNG, drawn with thin strokes instead of a font of the system.
#pragma once

#include <string_view>

class Raster;

/// The width in pixels of `text`, which is UTF-8, at a digit height of `size` pixels. Unknown characters are boxes.
float labelWidth(std::string_view text, float size);

/// The largest width of the text, here or in an SVG, which any sans-serif font may display.
float broadestWidth(std::string_view text, float size);

/// Draws in the axis color from `x` on, on the line `baseline`.
void drawLabel(Raster& raster, std::string_view text, float x, float baseline, float size);
