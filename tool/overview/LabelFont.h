// Texts in a PNG: thin strokes, drawn without any font of the system.
#pragma once

#include <string_view>

class Raster;

/// The width in pixels of `text`, which is UTF-8, at a digit height of `size` pixels. A character without a shape of
/// its own is a box.
float labelWidth(std::string_view text, float size);

/// The widest that the text comes out, here or in an SVG, where any sans-serif font may show it.
float broadestWidth(std::string_view text, float size);

/// Draws it in the color of the axis, from `x` on, standing on `baseline`.
void drawLabel(Raster& raster, std::string_view text, float x, float baseline, float size);
