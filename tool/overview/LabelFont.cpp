#include "tool/overview/LabelFont.h"

#include "tool/overview/Raster.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <numbers>
#include <optional>
#include <span>
#include <vector>

namespace {

constexpr float kDigitHeight = 7; // of the units below; y grows downwards, the baseline is at 7
constexpr float kGap = 1.8F;      // between letters
constexpr float kStroke = 1.2F;   // pixels

/// A line, or with `angles` an arc of an ellipse about (x, y) with radii (a, b), from and to degrees clockwise from the
/// right.
struct Stroke {
    float x, y, a, b; // line: from (x, y) to (a, b)
    std::optional<std::array<float, 2>> angles = {};
};

struct Glyph {
    std::string_view character;
    float width;
    std::array<Stroke, 6> strokes;
    std::size_t count;
};

constexpr Stroke line(float x0, float y0, float x1, float y1)
{
    return {x0, y0, x1, y1};
}

constexpr Stroke dot(float x, float y)
{
    return {x, y, x, y};
}

constexpr Stroke arc(float x, float y, float rx, float ry, float from = 0, float to = 360)
{
    return {x, y, rx, ry, std::array{from, to}};
}

template <class... Strokes>
constexpr Glyph glyph(std::string_view character, float width, Strokes... strokes)
{
    return {character, width, {strokes...}, sizeof...(strokes)};
}

constexpr std::array kGlyphs{
    glyph("0", 4, arc(2, 3.5F, 2, 3.5F)),
    glyph("1", 4, line(0.7F, 1.5F, 2.4F, 0), line(2.4F, 0, 2.4F, 7)),
    glyph("2", 4, arc(2, 2, 1.9F, 2, 190, 400), line(3.455F, 3.285F, 0.1F, 7), line(0.1F, 7, 4, 7)),
    glyph("3", 4, arc(1.9F, 1.7F, 1.7F, 1.7F, 205, 450), arc(1.9F, 5.2F, 2, 1.8F, 270, 515)),
    glyph("4", 4, line(3.1F, 7, 3.1F, 0), line(3.1F, 0, 0, 5), line(0, 5, 4.2F, 5)),
    glyph("5", 4, line(3.7F, 0, 0.8F, 0), line(0.8F, 0, 0.4F, 3.2F), arc(1.9F, 4.7F, 2.05F, 2.3F, 222, 510)),
    glyph("6", 4, arc(2, 4.8F, 2, 2.2F), arc(4.2F, 4.8F, 4.2F, 4.8F, 180, 255)),
    glyph("7", 4, line(0, 0, 4, 0), line(4, 0, 1.4F, 7)),
    glyph("8", 4, arc(2, 1.7F, 1.7F, 1.7F), arc(2, 5.2F, 2, 1.8F)),
    glyph("9", 4, arc(2, 2.2F, 2, 2.2F), arc(-0.2F, 2.2F, 4.2F, 4.8F, 0, 75)),
    glyph(":", 0.6F, dot(0.3F, 2.3F), dot(0.3F, 6.7F)),
    glyph(".", 0.6F, dot(0.3F, 6.7F)),
    glyph(" ", 0.6F),
    glyph("m", 5.6F, line(0, 2.3F, 0, 7), arc(1.4F, 4, 1.4F, 1.7F, 180, 360), line(2.8F, 4, 2.8F, 7),
          arc(4.2F, 4, 1.4F, 1.7F, 180, 360), line(5.6F, 4, 5.6F, 7)),
    glyph("s", 3.1F, arc(1.55F, 3.5F, 1.4F, 1.2F, 330, 90), arc(1.55F, 5.85F, 1.5F, 1.15F, 270, 515)),
    glyph("d", 3.6F, arc(1.75F, 4.9F, 1.75F, 2.1F), line(3.5F, 0, 3.5F, 7)),
    glyph("B", 4, line(0.2F, 0, 0.2F, 7), line(0.2F, 0, 2, 0), arc(2, 1.7F, 1.6F, 1.7F, 270, 450),
          line(0.2F, 3.4F, 2, 3.4F), arc(2, 5.2F, 1.9F, 1.8F, 270, 450), line(0.2F, 7, 2, 7)),
    glyph("\u2212", 3.8F, line(0, 3.8F, 3.8F, 3.8F)),
    glyph("\u221E", 7.2F, arc(2.3F, 3.8F, 1.6F, 1.8F), arc(5.6F, 3.8F, 1.6F, 1.8F)),
};

struct Point {
    float x, y;
};

struct Segment {
    Point from, to;
};

const Glyph* takeGlyph(std::string_view& text)
{
    for (const Glyph& glyph : kGlyphs)
        if (text.starts_with(glyph.character)) {
            text.remove_prefix(glyph.character.size());
            return &glyph;
        }
    text.remove_prefix(1);
    return nullptr;
}

// As straight pieces in pixels.
void addSegments(std::vector<Segment>& segments, const Stroke& stroke, Point origin, float scale)
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

void drawSegments(Raster& raster, std::span<const Segment> segments, Point from, Point to)
{
    for (int y = static_cast<int>(std::floor(from.y)) - 1; static_cast<float>(y) < to.y + 1; ++y)
        for (int x = static_cast<int>(std::floor(from.x)) - 1; static_cast<float>(x) < to.x + 1; ++x) {
            float nearest = std::numeric_limits<float>::max();
            for (const Segment& segment : segments)
                nearest =
                    std::min(nearest, distance({static_cast<float>(x) + 0.5F, static_cast<float>(y) + 0.5F}, segment));
            raster.putAxis(x, y, std::clamp(kStroke / 2 + 0.5F - nearest, 0.0F, 1.0F));
        }
}

} // namespace

float labelWidth(std::string_view text, float size)
{
    float width = -kGap;
    while (!text.empty())
        if (const Glyph* glyph = takeGlyph(text))
            width += glyph->width + kGap;
    return std::max(width, 0.0F) * size / kDigitHeight;
}

void drawLabel(Raster& raster, std::string_view text, float x, float baseline, float size)
{
    const float scale = size / kDigitHeight;
    std::vector<Segment> segments;
    while (!text.empty()) {
        const Glyph* glyph = takeGlyph(text);
        if (glyph == nullptr)
            continue;
        segments.clear();
        const Point origin{x, baseline - size};
        for (std::size_t i = 0; i < glyph->count; ++i)
            addSegments(segments, glyph->strokes[i], origin, scale);
        drawSegments(raster, segments, origin, {x + glyph->width * scale, baseline});
        x += (glyph->width + kGap) * scale;
    }
}
