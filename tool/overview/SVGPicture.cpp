#include "tool/overview/SVGPicture.h"

#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <cmath>
#include <iterator>
#include <vector>

namespace {

// Digits are 0.73 of the font size high in most sans-serif fonts.
constexpr float kFontSize = kLabelHeight / 0.73F;

std::string escaped(const std::string& text)
{
    std::string result;
    for (const char c : printable(text))
        switch (c) {
        case '<':
            result += "&lt;";
            break;
        case '>':
            result += "&gt;";
            break;
        case '&':
            result += "&amp;";
            break;
        default:
            result += c;
        }
    return result;
}

std::string hex(Color color)
{
    return fmt::format("#{:02x}{:02x}{:02x}", color.red, color.green, color.blue);
}

// To a hundredth of a pixel, as short as it goes.
std::string number(float value)
{
    return fmt::format("{:.7g}", std::round(static_cast<double>(value) * 100) / 100);
}

// Stairs, one step per column: along the upper edges, and back along the lower ones.
std::string stairs(const std::vector<PictureExtent>& extents, int left)
{
    std::string path = fmt::format("M{} {}", left, number(extents.front().top));
    const auto step = [&path](float y, int x) { path += fmt::format("V{}H{}", number(y), x); };
    int x = left;
    for (const PictureExtent& extent : extents)
        step(extent.top, ++x);
    for (auto extent = extents.rbegin(); extent != extents.rend(); ++extent)
        step(extent->bottom, --x);
    return path + "Z";
}

std::string polygon(const std::vector<PictureVertex>& vertices)
{
    std::string path;
    for (const PictureVertex& vertex : vertices)
        path += fmt::format("{}{} {}", path.empty() ? "M" : "L", number(vertex.x), number(vertex.extent.top));
    for (auto vertex = vertices.rbegin(); vertex != vertices.rend(); ++vertex)
        path += fmt::format("L{} {}", number(vertex->x), number(vertex->extent.bottom));
    return path + "Z";
}

// Lines of the axes as path data, and their labels as elements.
struct AxisParts {
    std::string lines, faintLines, labels;
};

AxisParts timeAxis(const WaveformPicture& picture)
{
    constexpr float kCharacterWidth = 0.56F * kFontSize;
    const float left = picture.timeLabelsFrom, right = static_cast<float>(picture.width) - 2;
    AxisParts parts;
    parts.faintLines = fmt::format("M{} {}.5H{}", picture.left, picture.plotHeight, picture.width);
    for (const PictureTick& tick : picture.times) {
        const float x = std::floor(tick.at) + 0.5F;
        std::string& lines = tick.label.empty() ? parts.faintLines : parts.lines;
        lines += fmt::format("M{} {}v{}", number(x), picture.plotHeight + 1,
                             tick.label.empty() ? kMinorTickLength : kMajorTickLength);
        if (tick.label.empty())
            continue;
        // A label that would leave the picture begins or ends at its edge.
        const float half = static_cast<float>(tick.label.size()) * kCharacterWidth / 2;
        const char* const anchor = x - half < left ? "start" : x + half > right ? "end" : "middle";
        const float at = x - half < left ? left : x + half > right ? right : x;
        parts.labels +=
            fmt::format("<text x=\"{}\" y=\"{}\" text-anchor=\"{}\">{}</text>\n", number(at),
                        number(static_cast<float>(picture.plotHeight) + kLabelBaseline), anchor, tick.label);
    }
    return parts;
}

AxisParts scale(const WaveformPicture& picture)
{
    AxisParts parts;
    for (const PictureTick& level : picture.levels) {
        const float y = std::floor(level.at - 0.5F) + 0.5F;
        parts.lines += fmt::format("M{} {}h{}", picture.left - kLevelTickLength, number(y), kLevelTickLength);
        parts.faintLines += fmt::format("M{} {}H{}", picture.left, number(y), picture.width);
        parts.labels += fmt::format("<text x=\"{}\" y=\"{}\" text-anchor=\"end\">{}</text>\n",
                                    number(static_cast<float>(picture.left) - kLabelGap), number(y + kLabelHeight / 2),
                                    level.label);
    }
    if (!picture.unit.label.empty())
        parts.labels += fmt::format("<text x=\"{}\" y=\"{}\">{}</text>\n", number(kLabelGap), number(picture.unit.at),
                                    picture.unit.label);
    return parts;
}

std::string axisText(const AxisParts& parts, Color color, float faintTone)
{
    return fmt::format("<g stroke=\"{0}\"><path d=\"{1}\" stroke-opacity=\"{2:.2g}\"/><path d=\"{3}\"/></g>\n"
                       "<g fill=\"{0}\" font-family=\"sans-serif\" font-size=\"{4:.3g}\">\n{5}</g>\n",
                       hex(color), parts.faintLines, faintTone, parts.lines, kFontSize, parts.labels);
}

std::string waveText(const WaveformPicture& picture, Color color)
{
    if (!picture.smooth.empty())
        return fmt::format("<path fill=\"{}\" d=\"{}\"/>\n", hex(color), polygon(picture.smooth));
    return fmt::format("<path fill=\"{0}\" fill-opacity=\"{1:.2g}\" d=\"{2}\"/>\n<path fill=\"{0}\" d=\"{3}\"/>\n",
                       hex(color), kPeakTone, stairs(picture.peaks, picture.left), stairs(picture.body, picture.left));
}

} // namespace

std::string svgOf(const WaveformPicture& picture, const PictureColors& colors, const std::string& title)
{
    std::string svg = fmt::format("<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"{0}\" height=\"{1}\" "
                                  "viewBox=\"0 0 {0} {1}\" role=\"img\">\n<title>{2}</title>\n",
                                  picture.width, picture.height, escaped(title));
    if (colors.background.alpha != 0)
        svg += fmt::format("<rect width=\"{}\" height=\"{}\" fill=\"{}\"/>\n", picture.width, picture.height,
                           hex(colors.background));
    if (!picture.levels.empty())
        svg += axisText(scale(picture), colors.axis, kLevelLineTone);
    svg += waveText(picture, colors.wave);
    if (picture.hasTimeAxis())
        svg += axisText(timeAxis(picture), colors.axis, kAxisLineTone);
    return svg + "</svg>\n";
}
