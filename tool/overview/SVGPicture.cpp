#include "tool/overview/SVGPicture.h"

#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <cmath>
#include <iterator>
#include <vector>

namespace {

std::string hex(Color color)
{
    return fmt::format("#{:02x}{:02x}{:02x}", color.red, color.green, color.blue);
}

// To a hundredth of a pixel, without trailing zeros.
std::string number(float value)
{
    return fmt::format("{:.7g}", std::round(static_cast<double>(value) * 100) / 100);
}

// Stairs with one step per column: along the upper edges and back along the lower ones.
std::string stairs(const std::vector<PictureExtent>& extents, const PictureFrame& frame)
{
    const float width = 1.0F / static_cast<float>(frame.scaleFactor), left = static_cast<float>(frame.left);
    std::string path = fmt::format("M{} {}", frame.left, number(extents.front().top));
    const auto step = [&](float y, std::size_t column) {
        path += fmt::format("V{}H{}", number(y), number(left + static_cast<float>(column) * width));
    };
    std::size_t column = 0;
    for (const PictureExtent& extent : extents)
        step(extent.top, ++column);
    for (auto extent = extents.rbegin(); extent != extents.rend(); ++extent)
        step(extent->bottom, --column);
    return path + "Z";
}

const char* word(Anchor anchor)
{
    return anchor == Anchor::start ? "start" : anchor == Anchor::end ? "end" : "middle";
}

// Path data of the axes' lines, and elements for their labels.
struct AxisParts {
    std::string lines, faintLines, labels;
};

AxisParts timeAxis(const WaveformPicture& picture)
{
    const PictureFrame& frame = picture.frame;
    AxisParts parts;
    parts.faintLines = fmt::format("M{} {}.5H{}", frame.left, frame.plotHeight, frame.width);
    for (const PictureTick& tick : picture.times) {
        std::string& lines = tick.label.empty() ? parts.faintLines : parts.lines;
        lines += fmt::format("M{} {}v{}", number(std::floor(tick.at) + 0.5F), frame.plotHeight + 1,
                             tick.label.empty() ? kMinorTickLength : kMajorTickLength);
        parts.labels +=
            svgText(tick.label, tick.labelAt, static_cast<float>(frame.plotHeight) + kLabelBaseline, tick.anchor);
    }
    return parts;
}

AxisParts scale(const WaveformPicture& picture)
{
    const PictureFrame& frame = picture.frame;
    AxisParts parts;
    for (const PictureTick& level : picture.levels) {
        const float y = std::floor(level.at - 0.5F) + 0.5F;
        parts.lines += fmt::format("M{} {}h{}", frame.left - kLevelTickLength, number(y), kLevelTickLength);
        parts.faintLines += fmt::format("M{} {}H{}", frame.left, number(y), frame.width);
        parts.labels += svgText(level.label, static_cast<float>(frame.left) - kLabelGap, level.labelAt, Anchor::end);
    }
    parts.labels += svgText(picture.unit.label, kLabelGap, picture.unit.at, Anchor::start);
    return parts;
}

// The names of the lanes and the lines between them.
AxisParts laneParts(const WaveformPicture& picture)
{
    AxisParts parts;
    for (const float border : picture.borders)
        parts.faintLines +=
            fmt::format("M{} {}H{}", picture.frame.left, number(std::floor(border) + 0.5F), picture.frame.width);
    for (const PictureTick& name : picture.names)
        parts.labels += svgText(name.label, static_cast<float>(picture.frame.labelsEnd), name.labelAt, Anchor::end);
    return parts;
}

std::string axisText(const AxisParts& parts, Color color, float faintTone)
{
    return fmt::format("<g stroke=\"{0}\"><path d=\"{1}\" stroke-opacity=\"{2:.2g}\"/><path d=\"{3}\"/></g>\n",
                       hex(color), parts.faintLines, faintTone, parts.lines) +
           svgLabels(parts.labels, color);
}

// Clipped to its lane by the view box of a nested element.
std::string lineText(const PictureLane& lane, const PictureFrame& frame, Color color)
{
    std::string path, dots;
    for (const PicturePoint& point : lane.line) {
        path += fmt::format("{}{} {}", path.empty() ? "M" : "L", number(point.x), number(point.y));
        if (lane.hasDots)
            dots += fmt::format("M{} {}h0", number(point.x), number(point.y));
    }
    if (lane.line.size() == 1)
        path += "h1";
    const float height = lane.bottom - lane.top;
    std::string svg =
        fmt::format("<svg x=\"{0}\" y=\"{1}\" width=\"{2}\" height=\"{3}\" viewBox=\"{0} {1} {2} {3}\">\n"
                    "<path fill=\"none\" stroke=\"{4}\" stroke-width=\"{5:.3g}\" stroke-linecap=\"round\" "
                    "stroke-linejoin=\"round\" d=\"{6}\"/>\n",
                    frame.left, number(lane.top), frame.plotWidth, number(height), hex(color), kLineWidth, path);
    if (!dots.empty())
        svg += fmt::format("<path stroke=\"{}\" stroke-width=\"{:.3g}\" stroke-linecap=\"round\" d=\"{}\"/>\n",
                           hex(color), 2 * kDotRadius, dots);
    return svg + "</svg>\n";
}

std::string laneText(const PictureLane& lane, const PictureFrame& frame, Color color)
{
    if (!lane.line.empty())
        return lineText(lane, frame, color);
    return fmt::format("<path fill=\"{0}\" fill-opacity=\"{1:.2g}\" d=\"{2}\"/>\n<path fill=\"{0}\" d=\"{3}\"/>\n",
                       hex(color), kPeakTone, stairs(lane.peaks, frame), stairs(lane.body, frame));
}

std::string markText(const WaveformPicture& picture, const PictureColors& colors)
{
    std::string svg;
    for (const bool isClipping : {false, true}) {
        std::string path;
        for (const PictureMark& mark : picture.marks)
            if (mark.isClipping == isClipping)
                path += fmt::format("M{} {}H{}V{}H{}Z", number(mark.left), number(mark.top), number(mark.right),
                                    number(mark.bottom), number(mark.left));
        if (!path.empty())
            svg += fmt::format("<g fill=\"{}\"><path d=\"{}\"/></g>\n", hex(isClipping ? colors.clipping : colors.axis),
                               path);
    }
    return svg;
}

} // namespace

std::string svgText(const std::string& label, float x, float y, Anchor anchor)
{
    return label.empty() ? std::string()
                         : fmt::format("<text x=\"{}\" y=\"{}\" text-anchor=\"{}\">{}</text>\n", number(x), number(y),
                                       word(anchor), label);
}

std::string svgLabels(const std::string& texts, Color color)
{
    return fmt::format("<g fill=\"{}\" font-family=\"sans-serif\" font-size=\"{:.3g}\">\n{}</g>\n", hex(color),
                       kSVGFontSize, texts);
}

std::string svgEscaped(const std::string& text)
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

std::string svgParts(const WaveformPicture& picture, const PictureColors& colors)
{
    std::string svg;
    if (!picture.levels.empty())
        svg += axisText(scale(picture), colors.axis, kLevelLineTone);
    if (!picture.borders.empty() || !picture.names.empty())
        svg += axisText(laneParts(picture), colors.axis, kAxisLineTone);
    for (const PictureLane& lane : picture.lanes)
        svg += laneText(lane, picture.frame, colors.wave);
    svg += markText(picture, colors);
    if (picture.frame.hasTimeAxis())
        svg += axisText(timeAxis(picture), colors.axis, kAxisLineTone);
    return svg;
}

std::string svgHead(int width, int height, int scaleFactor, const PictureColors& colors, const std::string& title)
{
    std::string svg = fmt::format("<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"{0}\" height=\"{1}\" "
                                  "viewBox=\"0 0 {2} {3}\" role=\"img\">\n<title>{4}</title>\n",
                                  width * scaleFactor, height * scaleFactor, width, height, svgEscaped(title));
    if (colors.background.alpha != 0)
        svg += fmt::format("<rect width=\"{}\" height=\"{}\" fill=\"{}\"/>\n", width, height, hex(colors.background));
    return svg;
}

std::string svgOf(const WaveformPicture& picture, const PictureColors& colors, const std::string& title)
{
    const PictureFrame& frame = picture.frame;
    return svgHead(frame.width, frame.height, frame.scaleFactor, colors, title) + svgParts(picture, colors) +
           "</svg>\n";
}
