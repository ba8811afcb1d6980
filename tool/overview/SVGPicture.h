// A waveform picture as an SVG file.
#pragma once

#include "tool/overview/PictureColors.h"
#include "tool/overview/WaveformPicture.h"

#include <string>

/// Digits are 0.73 of the font size high in most sans-serif fonts.
inline constexpr float kSVGFontSize = kLabelHeight / 0.73F;

/// The text of the SVG file, whose size is that of the PNG, in the picture's own pixels. `title` may hold anything.
std::string svgOf(const WaveformPicture& picture, const PictureColors& colors, const std::string& title);

// What a file of several pictures is made of.

/// The root element up to its content, with the background.
std::string svgHead(int width, int height, int scaleFactor, const PictureColors& colors, const std::string& title);
/// What is drawn of a picture, its corner at (0, 0).
std::string svgParts(const WaveformPicture& picture, const PictureColors& colors);
/// A text for people, fit to stand between tags.
std::string svgEscaped(const std::string& text);
/// A label that is escaped, and labels in their font and color.
std::string svgText(const std::string& label, float x, float y, Anchor anchor);
std::string svgLabels(const std::string& texts, Color color);
