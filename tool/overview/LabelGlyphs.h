// The shapes of letters in a PNG: lines and arcs, in units of a seventh of a digit's height.
#pragma once

#include <array>
#include <cstddef>
#include <optional>
#include <span>
#include <string_view>

/// A line, or with `angles` an arc of an ellipse around (x, y) with radii (a, b), from and to degrees clockwise from
/// the right. y grows downwards; digits and capitals extend from 0 to 7, the baseline.
struct LabelStroke {
    float x, y, a, b; // line: from (x, y) to (a, b)
    std::optional<std::array<float, 2>> angles = {};
};

struct LabelGlyph {
    float width;
    std::array<LabelStroke, 6> strokes;
    std::size_t count;

    std::span<const LabelStroke> all() const { return std::span(strokes).first(count); }
};

/// The shape of a character: printable ASCII, Latin-1 letters and a few signs; a box for others. None for a character
/// without width.
std::optional<LabelGlyph> labelGlyph(char32_t character);
/// The mark of a combining character; else 0.
char labelMark(char32_t character);
/// The glyph with a mark, one of `'^~:o,/ (grave, acute, …, diaeresis, ring, cedilla, slash). `isLow` if the glyph has
/// no ascender.
LabelGlyph markOn(const LabelGlyph& glyph, char mark, bool isLow);
