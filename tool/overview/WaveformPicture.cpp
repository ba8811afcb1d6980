#include "tool/overview/WaveformPicture.h"

#include "tool/overview/TimeAxis.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace {

constexpr int kTimeStripHeight = 27;
constexpr int kLowestWithTimeStrip = 72; // below, the wave gets all of the height
constexpr int kScaleWidth = 44;
constexpr float kUnitWidth = 30; // of the corner below the scale
constexpr float kHairline = 1;
constexpr float kFullScale = 127;

/// From sample values to y.
class Amplitude {
public:
    explicit Amplitude(int height)
        : centre_(static_cast<float>(height) / 2),
          reach_(centre_ - std::clamp(static_cast<float>(height) * 0.05F, 0.5F, 12.0F))
    {
    }

    float y(float value) const { return centre_ - value / kFullScale * reach_; }

    PictureExtent extent(float low, float high) const
    {
        PictureExtent extent{y(high), y(low)};
        if (extent.bottom - extent.top < kHairline) {
            const float middle = (extent.top + extent.bottom) / 2;
            extent = {middle - kHairline / 2, middle + kHairline / 2};
        }
        return extent;
    }

    float reach() const { return reach_; }

private:
    float centre_;
    float reach_;
};

void drawWave(WaveformPicture& picture, const Waveform& waveform, const Amplitude& amplitude, double from, double to)
{
    if ((to - from) / static_cast<double>(kOverviewFramesPerPoint) < picture.plotWidth) {
        for (const WaveformVertex& vertex : smoothOutline(waveform, from, to, picture.plotWidth))
            picture.smooth.push_back(
                {vertex.x + static_cast<float>(picture.left), amplitude.extent(vertex.low, vertex.high)});
        return;
    }
    for (const WaveformColumn& column : foldedColumns(waveform, from, to, picture.plotWidth)) {
        picture.peaks.push_back(amplitude.extent(column.low, column.high));
        picture.body.push_back(amplitude.extent(column.meanLow, column.meanHigh));
    }
}

void markTimes(WaveformPicture& picture, double start, double end)
{
    for (TimeTick& tick : timeTicks(start, end, picture.plotWidth)) {
        const double x = picture.left + (tick.seconds - start) / (end - start) * picture.plotWidth;
        // The last tick of all stands at the very edge, on the last column.
        picture.times.push_back({static_cast<float>(std::clamp(x, 0.0, picture.width - 1.0)), std::move(tick.label)});
    }
}

// Full scale and each half of it, in decibels, as far down as their labels have room.
void markLevels(WaveformPicture& picture, const Amplitude& amplitude)
{
    constexpr float kLeastDistance = 15;
    std::vector<PictureTick> below;
    float fraction = 1, taken = 2 * amplitude.reach();
    for (int decibels = 0; fraction * amplitude.reach() >= kLeastDistance; decibels -= 6, fraction /= 2) {
        if (taken - fraction * amplitude.reach() < kLeastDistance)
            break;
        taken = fraction * amplitude.reach();
        const std::string label = decibels == 0 ? "0" : fmt::format("\u2212{}", -decibels);
        picture.levels.push_back({amplitude.y(fraction * kFullScale), label});
        below.push_back({amplitude.y(-fraction * kFullScale), label});
    }
    picture.levels.push_back({amplitude.y(0), "\u2212\u221E"});
    picture.levels.insert(picture.levels.end(), below.rbegin(), below.rend());
    if (picture.hasTimeAxis()) {
        picture.unit = {static_cast<float>(picture.plotHeight) + kLabelBaseline, "dB"};
        picture.timeLabelsFrom = kUnitWidth;
    }
}

} // namespace

WaveformPicture pictureOf(const Waveform& waveform, const PictureSettings& settings)
{
    WaveformPicture picture;
    picture.width = settings.width;
    picture.height = settings.height;
    picture.left = settings.scale ? std::min(kScaleWidth, settings.width / 2) : 0;
    picture.plotWidth = picture.width - picture.left;
    picture.plotHeight = picture.height - (picture.height < kLowestWithTimeStrip ? 0 : kTimeStripHeight);

    const double end = std::min(settings.end, waveform.seconds());
    const double from = std::min(settings.start * waveform.sampleRate, static_cast<double>(waveform.frames) - 1);
    const double to = std::clamp(end * waveform.sampleRate, from + 1, static_cast<double>(waveform.frames));
    const Amplitude amplitude(picture.plotHeight);
    drawWave(picture, waveform, amplitude, from, to);
    if (picture.hasTimeAxis())
        markTimes(picture, from / waveform.sampleRate, to / waveform.sampleRate);
    if (settings.scale)
        markLevels(picture, amplitude);
    return picture;
}
