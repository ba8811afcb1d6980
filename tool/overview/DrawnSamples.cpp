#include "tool/overview/DrawnSamples.h"

#include "tool/overview/SampleColumns.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace {

bool isFinerThanOverviews(FrameRange range, const PictureSettings& settings)
{
    const std::int64_t columns = std::int64_t{settings.width} * settings.scaleFactor;
    return range.to - range.from < columns * kOverviewFramesPerPoint;
}

// The level at which samples cannot go higher: integers of that many bits end one step below 1.
float clippingOf(const AudioFileInfo& info)
{
    if (info.compressed || info.floatingPoint || info.bitsPerSample <= 0)
        return 1;
    return 1 - std::ldexp(1.0F, 1 - std::min(info.sourceBits > 0 ? info.sourceBits : info.bitsPerSample, 24));
}

// A NaN is silence, and infinity is placed far beyond every picture.
float sampleOf(const SoundLane& lane, const float* frame, int channels)
{
    constexpr float kFarAway = 1e4F;
    float sum = 0;
    if (lane.kind == SoundLane::Kind::channel)
        sum = frame[lane.channel];
    else
        for (int channel = 0; channel < channels; ++channel)
            sum += frame[channel] / static_cast<float>(channels);
    return std::isnan(sum) ? 0 : std::clamp(sum, -kFarAway, kFarAway);
}

bool isLine(const SoundLane& lane)
{
    return lane.kind == SoundLane::Kind::channel || lane.kind == SoundLane::Kind::sum;
}

} // namespace

std::vector<SoundLane> lanesFor(ChannelChoice choice, const AudioFileInfo& info, FrameRange range,
                                const PictureSettings& settings)
{
    constexpr int kComfortableLane = 24;
    if (choice.kind == ChannelChoice::Kind::overview && isFinerThanOverviews(range, settings) &&
        settings.height >= info.channels * kComfortableLane)
        choice.kind = ChannelChoice::Kind::split;
    std::vector<SoundLane> lanes = lanesOf(choice, info);
    if (lanes.size() > 1 && settings.height < leastHeightFor(lanes.size()))
        throw Failure(
            fmt::format("has {} channels, which need a --height of {}", lanes.size(), leastHeightFor(lanes.size())));
    return lanes;
}

DrawnSound drawnSamples(SoundReader& sound, FrameRange range, const std::vector<SoundLane>& lanes,
                        const PictureFrame& frame, const std::function<void(std::int64_t frames)>& progress)
{
    const int channels = sound.info().channels;
    const double length = static_cast<double>(range.to - range.from);
    DrawnSound drawn{static_cast<double>(range.from),
                     static_cast<double>(range.to),
                     sampleRateOf(sound.info()),
                     clippingOf(sound.info()),
                     {}};
    for (const SoundLane& lane : lanes)
        drawn.lanes.push_back({lane, {}, {}});
    const bool asLine = length < frame.plotWidth;
    SampleColumns columns(lanes, channels, drawn.from, length / frame.columns(),
                          static_cast<std::size_t>(frame.columns()));
    std::int64_t at = range.from;
    // A line continues to the sample after the last one.
    const std::int64_t end = asLine ? std::min(range.to + 1, sound.info().frames) : range.to;
    sound.read(range.from, end, [&](const float* samples, std::int64_t frames) {
        columns.add(samples, at, std::min(frames, range.to - at));
        at += frames;
        if (asLine)
            for (DrawnLane& lane : drawn.lanes)
                for (std::int64_t i = 0; i < frames && isLine(lane.lane); ++i)
                    lane.samples.push_back(sampleOf(lane.lane, samples + i * channels, channels));
        progress(frames);
    });
    for (std::size_t i = 0; i < lanes.size(); ++i)
        if (drawn.lanes[i].samples.empty())
            drawn.lanes[i].columns = columns.take(i);
    return drawn;
}

bool suffices(const FileOverview& stored, ChannelChoice choice, FrameRange range, const PictureSettings& settings)
{
    const bool isItsLane = choice.kind == ChannelChoice::Kind::overview || stored.info().channels == 1;
    // Amplification would show the steps of its 8 bits.
    return isItsLane && settings.gain && *settings.gain <= 0 && !isFinerThanOverviews(range, settings);
}
