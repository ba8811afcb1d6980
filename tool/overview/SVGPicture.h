// A waveform picture as an SVG file.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/WaveformPicture.h"

#include <string>

/// In most sans-serif fonts, digits have 0.73 of the font size.
inline constexpr float kSVGFontSize = kLabelHeight / 0.73F;

/// The text of the SVG file, with the PNG's size, in the picture's own pixels. `title` may contain anything.
std::string svgOf(const WaveformPicture& picture, const PictureColors& colors, const std::string& title);

// Parts of a file with several pictures.

/// The root element up to its content, with the background.
std::string svgHead(int width, int height, int scaleFactor, const PictureColors& colors, const std::string& title);
/// The drawing of a picture, with its corner at (0, 0).
std::string svgParts(const WaveformPicture& picture, const PictureColors& colors);
/// Escapes a text so that it can stand between tags.
std::string svgEscaped(const std::string& text);
/// An escaped label; labels in their font and color.
std::string svgText(const std::string& label, float x, float y, Anchor anchor);
std::string svgLabels(const std::string& texts, Color color);
