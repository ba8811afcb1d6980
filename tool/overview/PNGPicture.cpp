#include "tool/overview/PNGPicture.h"

#include "tool/overview/LabelFont.h"
#include "tool/shared/output/Failure.h"

#include <png.h>

#include <algorithm>
#include <cmath>

namespace {

void drawColumns(Raster& raster, const WaveformPicture& picture)
{
    ColumnCoverage peak(picture.plotHeight), body(picture.plotHeight);
    for (int column = 0; column < picture.plotWidth; ++column) {
        const auto index = static_cast<std::size_t>(column);
        peak.add(picture.peaks[index].top, picture.peaks[index].bottom, 1);
        body.add(picture.body[index].top, picture.body[index].bottom, 1);
        const auto& peaks = peak.take();
        const auto& bodies = body.take();
        const int first = std::max(static_cast<int>(picture.peaks[index].top), 0);
        const int end = std::min(static_cast<int>(picture.peaks[index].bottom) + 1, picture.plotHeight);
        for (int y = first; y < end; ++y) {
            const auto row = static_cast<std::size_t>(y);
            raster.putWave(picture.left + column, y,
                           bodies[row] + kPeakTone * std::max(peaks[row] - bodies[row], 0.0F));
        }
    }
}

// Each column is looked at in a few places, where the outline's lines are cut.
void drawSmooth(Raster& raster, const WaveformPicture& picture)
{
    constexpr int kPlaces = 8;
    ColumnCoverage wave(picture.plotHeight);
    auto vertex = picture.smooth.begin();
    for (int column = picture.left; column < picture.width; ++column) {
        for (int place = 0; place < kPlaces; ++place) {
            const float x = static_cast<float>(column) + (static_cast<float>(place) + 0.5F) / kPlaces;
            while (vertex + 2 < picture.smooth.end() && (vertex + 1)->x < x)
                ++vertex;
            const PictureVertex &from = vertex[0], &to = vertex[1];
            const float part = std::clamp((x - from.x) / (to.x - from.x), 0.0F, 1.0F);
            wave.add(std::lerp(from.extent.top, to.extent.top, part),
                     std::lerp(from.extent.bottom, to.extent.bottom, part), 1.0F / kPlaces);
        }
        const auto& coverage = wave.take();
        for (int y = 0; y < picture.plotHeight; ++y)
            raster.putWave(column, y, coverage[static_cast<std::size_t>(y)]);
    }
}

void drawTimeAxis(Raster& raster, const WaveformPicture& picture)
{
    const auto top = static_cast<float>(picture.plotHeight);
    raster.fillAxis(static_cast<float>(picture.left), top, static_cast<float>(picture.width), top + 1, kAxisLineTone);
    for (const PictureTick& tick : picture.times) {
        const float x = std::floor(tick.at); // a crisp line
        const int length = tick.label.empty() ? kMinorTickLength : kMajorTickLength;
        raster.fillAxis(x, top, x + 1, top + 1 + static_cast<float>(length), tick.label.empty() ? kAxisLineTone : 1);
        if (tick.label.empty())
            continue;
        const float width = labelWidth(tick.label, kLabelHeight);
        const float last = static_cast<float>(picture.width) - width - 2;
        drawLabel(raster, tick.label,
                  std::round(std::max(std::min(x + 0.5F - width / 2, last), picture.timeLabelsFrom)),
                  top + kLabelBaseline, kLabelHeight);
    }
}

void drawScale(Raster& raster, const WaveformPicture& picture)
{
    const auto left = static_cast<float>(picture.left);
    for (const PictureTick& level : picture.levels) {
        const float y = std::floor(level.at - 0.5F);
        raster.fillAxis(left - kLevelTickLength, y, left, y + 1, 1);
        raster.fillAxis(left, y, static_cast<float>(picture.width), y + 1, kLevelLineTone);
        const float width = labelWidth(level.label, kLabelHeight);
        const float baseline = std::round(
            std::clamp(y + kLabelHeight / 2 + 0.5F, kLabelHeight + 1, static_cast<float>(picture.plotHeight) - 1));
        drawLabel(raster, level.label, std::round(left - kLabelGap - width), baseline, kLabelHeight);
    }
    drawLabel(raster, picture.unit.label, kLabelGap, picture.unit.at, kLabelHeight);
}

} // namespace

Raster rasterOf(const WaveformPicture& picture)
{
    Raster raster(picture.width, picture.height);
    drawScale(raster, picture);
    if (picture.smooth.empty())
        drawColumns(raster, picture);
    else
        drawSmooth(raster, picture);
    if (picture.hasTimeAxis())
        drawTimeAxis(raster, picture);
    return raster;
}

std::string pngOf(const WaveformPicture& picture, const PictureColors& colors)
{
    const Raster raster = rasterOf(picture);
    std::array<png_byte, 4 * 256> palette;
    std::size_t at = 0;
    for (const Color& color : Raster::palette(colors))
        for (const png_byte channel : {color.red, color.green, color.blue, color.alpha})
            palette[at++] = channel;

    png_image image = {};
    image.version = PNG_IMAGE_VERSION;
    image.width = static_cast<png_uint_32>(raster.width());
    image.height = static_cast<png_uint_32>(raster.height());
    image.format = PNG_FORMAT_RGBA_COLORMAP;
    image.colormap_entries = 256;
    image.flags = PNG_IMAGE_FLAG_FAST;
    std::string bytes(PNG_IMAGE_PNG_SIZE_MAX(image), '\0');
    png_alloc_size_t size = bytes.size();
    if (png_image_write_to_memory(&image, bytes.data(), &size, 0, raster.pixels().data(), 0, palette.data()) == 0)
        throw Failure(std::string("no PNG can be made of it: ") + image.message);
    bytes.resize(size);
    return bytes;
}
