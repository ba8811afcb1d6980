#include "tool/overview/ContactSheet.h"

#include "tool/overview/LabelFont.h"
#include "tool/overview/PNGFile.h"
#include "tool/overview/PNGPicture.h"
#include "tool/overview/SVGPicture.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <functional>

namespace {

constexpr std::size_t kMostCells = 10000;
constexpr int kMostWidth = 32767, kMostHeight = 65535; // pixels
constexpr int kGap = 12;                               // around and between cells
constexpr int kNameStrip = 18;
constexpr float kNameBaseline = 13;
constexpr float kInset = 1; // as wide as strokes
constexpr float kLineHeight = 14;
constexpr double kShape = 1.6; // width to height, unless the number of columns is given

std::string fitted(const std::string& text, float width)
{
    if (broadestWidth(text, kLabelHeight) <= width)
        return text;
    int low = 1, high = displayWidth(text);
    while (low < high) {
        const int middle = (low + high + 1) / 2;
        if (broadestWidth(shortened(text, middle), kLabelHeight) <= width)
            low = middle;
        else
            high = middle - 1;
    }
    const std::string result = shortened(text, low);
    return broadestWidth(result, kLabelHeight) <= width ? result : std::string();
}

// Breaks between words; cuts the last of `most` lines.
std::vector<std::string> lines(const std::string& text, float width, std::size_t most)
{
    std::vector<std::string> lines;
    std::string_view rest = text;
    while (!rest.empty() && lines.size() < most) {
        std::size_t end = rest.size();
        if (lines.size() + 1 < most)
            while (broadestWidth(rest.substr(0, end), kLabelHeight) > width) {
                const std::size_t space = rest.rfind(' ', end - 1);
                if (space == std::string_view::npos || space == 0)
                    break;
                end = space;
            }
        lines.push_back(fitted(std::string(rest.substr(0, end)), width));
        rest.remove_prefix(std::min(end + 1, rest.size()));
    }
    return lines;
}

/// Receives a text, its x and its baseline in the cell.
using PutText = std::function<void(const std::string& text, float x, float baseline, Anchor anchor)>;

void layOutTexts(const SheetCell& cell, const PictureSettings& settings, const PutText& put)
{
    const auto width = static_cast<float>(settings.width) - 2 * kInset,
               baseline = static_cast<float>(settings.height) + kNameBaseline;
    const float duration = broadestWidth(cell.duration, kLabelHeight);
    const bool hasDuration = duration > 0 && duration < width / 2;
    if (hasDuration)
        put(cell.duration, kInset + width, baseline, Anchor::end);
    if (const std::string name =
            fitted(printable(shownName(cell.name)), hasDuration ? width - duration - kLabelGap : width);
        !name.empty())
        put(name, kInset, baseline, Anchor::start);
    if (cell.picture)
        return;
    const auto most = static_cast<std::size_t>(std::max(static_cast<float>(settings.height) / kLineHeight, 1.0F));
    const std::vector<std::string> told = lines(printable(cell.problem), width - 2 * kLabelGap, most);
    float y =
        (static_cast<float>(settings.height) - static_cast<float>(told.size()) * kLineHeight) / 2 + kLabelHeight + 2;
    for (const std::string& line : told) {
        put(line, kLabelGap, std::round(y), Anchor::start);
        y += kLineHeight;
    }
}

} // namespace

std::optional<SheetFormat> sheetFormatOf(const std::string& out)
{
    std::string extension = out.size() > 4 ? out.substr(out.size() - 4) : "";
    for (char& c : extension)
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    return extension == ".png"   ? std::optional(SheetFormat::png)
           : extension == ".svg" ? std::optional(SheetFormat::svg)
                                 : std::nullopt;
}

void ContactSheet::add(SheetCell cell)
{
    if (++count_ <= kMostCells)
        cells_.push_back(std::move(cell));
}

int ContactSheet::cellWidth() const
{
    return settings_.width + kGap;
}

int ContactSheet::cellHeight() const
{
    return settings_.height + kNameStrip + kGap;
}

int ContactSheet::columns() const
{
    const int count = static_cast<int>(cells_.size());
    const double square = std::sqrt(static_cast<double>(count) * cellHeight() / cellWidth() * kShape);
    return std::clamp(columns_.value_or(static_cast<int>(std::lround(square))), 1, std::max(count, 1));
}

int ContactSheet::rows() const
{
    return (static_cast<int>(cells_.size()) + columns() - 1) / columns();
}

ContactSheet::Size ContactSheet::size() const
{
    if (count_ > kMostCells)
        throw Failure(fmt::format("a sheet takes {} files, not {}", kMostCells, count_));
    const std::int64_t width = std::int64_t{columns()} * cellWidth() + kGap;
    const std::int64_t height = std::int64_t{rows()} * cellHeight() + kGap;
    if (width * settings_.scaleFactor > kMostWidth || height * settings_.scaleFactor > kMostHeight)
        throw Failure(
            fmt::format("the sheet would have {} x {} pixels, where {} x {} is the most: other --columns or a "
                        "smaller --height would help",
                        width * settings_.scaleFactor, height * settings_.scaleFactor, kMostWidth, kMostHeight));
    return {static_cast<int>(width) * settings_.scaleFactor, static_cast<int>(height) * settings_.scaleFactor};
}

void ContactSheet::write(SheetFormat format, const PictureColors& colors, const Sink& sink) const
{
    if (format == SheetFormat::png)
        writePNG(colors, sink);
    else
        writeSVG(colors, sink);
}

void ContactSheet::writePNG(const PictureColors& colors, const Sink& sink) const
{
    const Size all = size();
    const int factor = settings_.scaleFactor;
    const auto scale = static_cast<float>(factor);
    PNGFile png(all.width, all.height, colors);
    const auto next = static_cast<std::size_t>(columns());
    for (std::size_t first = 0; first < cells_.size(); first += next) {
        Raster band(all.width, cellHeight() * factor);
        for (std::size_t i = first; i < std::min(first + next, cells_.size()); ++i) {
            const int x = static_cast<int>(i - first) * cellWidth() + kGap;
            if (cells_[i].picture)
                drawPicture(band, *cells_[i].picture, x, kGap);
            layOutTexts(cells_[i], settings_, [&](const std::string& text, float at, float baseline, Anchor anchor) {
                const float left =
                    static_cast<float>(x) + at - (anchor == Anchor::end ? labelWidth(text, kLabelHeight) : 0);
                drawLabel(band, text, std::round(left * scale), (baseline + kGap) * scale, kLabelHeight * scale);
            });
        }
        png.add(band);
        sink(png.take());
    }
    png.add(Raster(all.width, kGap * factor));
    png.finish();
    sink(png.take());
}

void ContactSheet::writeSVG(const PictureColors& colors, const Sink& sink) const
{
    const Size all = size();
    const int factor = settings_.scaleFactor;
    sink(svgHead(all.width / factor, all.height / factor, factor, colors, fmt::format("{} files", cells_.size())));
    const int next = columns();
    for (int i = 0; i < static_cast<int>(cells_.size()); ++i) {
        const SheetCell& cell = cells_[static_cast<std::size_t>(i)];
        // A nested element clips text that another font makes too wide.
        std::string svg = fmt::format("<svg x=\"{}\" y=\"{}\" width=\"{}\" height=\"{}\">\n<title>{}</title>\n",
                                      i % next * cellWidth() + kGap, i / next * cellHeight() + kGap, settings_.width,
                                      settings_.height + kNameStrip, svgEscaped(shownName(cell.name)));
        if (cell.picture)
            svg += svgParts(*cell.picture, colors);
        std::string texts;
        layOutTexts(cell, settings_, [&](const std::string& text, float x, float baseline, Anchor anchor) {
            texts += svgText(svgEscaped(text), x, baseline, anchor);
        });
        sink(svg + svgLabels(texts, colors.axis) + "</svg>\n");
    }
    sink("</svg>\n");
}
