#include "tool/overview/LabelFont.h"

#include "tool/overview/LabelGlyphs.h"
#include "tool/overview/Raster.h"
#include "tool/shared/output/DisplayWidth.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numbers>
#include <span>
#include <vector>

namespace {

constexpr float kDigitHeight = 7;  // units
constexpr float kLetterGap = 1.8F; // between letters
constexpr float kStroke = 0.15F;   // of the digit height
constexpr float kBeyond = 2.6F;    // height of accents and depth of descenders, in units

struct Point {
    float x, y;
};

struct Segment {
    Point from, to;
};

struct PlacedGlyph {
    LabelGlyph glyph;
    float x; // units
};

std::vector<PlacedGlyph> placed(std::string_view text)
{
    std::vector<PlacedGlyph> glyphs;
    float x = 0;
    bool isLow = false;
    while (!text.empty()) {
        const char32_t character = takeCharacter(text);
        if (const char mark = labelMark(character); mark != 0 && !glyphs.empty()) {
            glyphs.back().glyph = markOn(glyphs.back().glyph, mark, isLow);
        } else if (const auto glyph = labelGlyph(character)) {
            glyphs.push_back({*glyph, x});
            x += glyph->width + kLetterGap;
            isLow = character >= 'a' && character <= 'z';
        }
    }
    return glyphs;
}

// Converts it to straight segments in pixels.
void addSegments(std::vector<Segment>& segments, const LabelStroke& stroke, Point origin, float scale)
{
    const auto placed = [&](float x, float y) { return Point{origin.x + x * scale, origin.y + y * scale}; };
    if (!stroke.angles) {
        segments.push_back({placed(stroke.x, stroke.y), placed(stroke.a, stroke.b)});
        return;
    }
    const float from = stroke.angles->at(0), to = stroke.angles->at(1);
    const int pieces = std::max(2, static_cast<int>(std::abs(to - from) / 22));
    const auto pointAt = [&](int i) {
        const float angle =
            (from + (to - from) * static_cast<float>(i) / static_cast<float>(pieces)) * std::numbers::pi_v<float> / 180;
        return placed(stroke.x + stroke.a * std::cos(angle), stroke.y + stroke.b * std::sin(angle));
    };
    for (int i = 0; i < pieces; ++i)
        segments.push_back({pointAt(i), pointAt(i + 1)});
}

float distance(Point point, const Segment& segment)
{
    const float dx = segment.to.x - segment.from.x, dy = segment.to.y - segment.from.y;
    const float px = point.x - segment.from.x, py = point.y - segment.from.y;
    const float length = dx * dx + dy * dy;
    const float part = length > 0 ? std::clamp((px * dx + py * dy) / length, 0.0F, 1.0F) : 0;
    return std::hypot(px - part * dx, py - part * dy);
}

void drawSegments(Raster& raster, std::span<const Segment> segments, Point from, Point to, float width)
{
    for (int y = static_cast<int>(std::floor(from.y)) - 1; static_cast<float>(y) < to.y + 1; ++y)
        for (int x = static_cast<int>(std::floor(from.x)) - 1; static_cast<float>(x) < to.x + 1; ++x) {
            float nearest = std::numeric_limits<float>::max();
            for (const Segment& segment : segments)
                nearest =
                    std::min(nearest, distance({static_cast<float>(x) + 0.5F, static_cast<float>(y) + 0.5F}, segment));
            raster.putAxis(x, y, std::clamp(width / 2 + 0.5F - nearest, 0.0F, 1.0F));
        }
}

/// The widest that a character is in the fonts in use, in ems.
float broadestEms(char32_t character)
{
    constexpr std::string_view kBroad = "mwMW@%", kNarrow = " .,:;'|!ijlI";
    const auto isOf = [character](std::string_view set) {
        return set.find(static_cast<char>(character)) != std::string_view::npos;
    };
    const auto glyph = labelGlyph(character);
    if (!glyph)
        return 0;
    if (character < 0x80) {
        if (isOf(kBroad))
            return 1;
        return isOf(kNarrow) ? 0.42F : 0.7F;
    }
    return character >= 0x1100 && glyph->width > 3.8F ? 1.1F : 0.9F;
}

} // namespace

float labelWidth(std::string_view text, float size)
{
    const std::vector<PlacedGlyph> glyphs = placed(text);
    return glyphs.empty() ? 0 : (glyphs.back().x + glyphs.back().glyph.width) * size / kDigitHeight;
}

float broadestWidth(std::string_view text, float size)
{
    constexpr float kEm = 1 / 0.73F; // of the digit height
    float ems = 0;
    for (std::string_view rest = text; !rest.empty();)
        ems += broadestEms(takeCharacter(rest));
    return std::max(labelWidth(text, size), ems * kEm * size);
}

void drawLabel(Raster& raster, std::string_view text, float x, float baseline, float size)
{
    const float scale = size / kDigitHeight;
    std::vector<Segment> segments;
    for (const PlacedGlyph& item : placed(text)) {
        segments.clear();
        const Point origin{x + item.x * scale, baseline - size};
        for (const LabelStroke& stroke : item.glyph.all())
            addSegments(segments, stroke, origin, scale);
        if (!segments.empty())
            drawSegments(raster, segments, {origin.x, origin.y - kBeyond * scale},
                         {origin.x + item.glyph.width * scale, baseline + kBeyond * scale}, kStroke * size);
    }
}
