#include "tool/overview/SampleColumns.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace {

constexpr std::int64_t kRun = kOverviewFramesPerPoint;

struct Extremes {
    float low = std::numeric_limits<float>::infinity(), high = -low;

    // A NaN is neither.
    void add(float sample)
    {
        low = sample < low ? sample : low;
        high = sample > high ? sample : high;
    }
};

Extremes extremesOf(const SoundLane& lane, const float* samples, std::int64_t frames, int channels)
{
    Extremes extremes;
    const float* const end = samples + frames * channels;
    switch (lane.kind) {
    case SoundLane::Kind::channel:
        for (const float* at = samples + lane.channel; at < end; at += channels)
            extremes.add(*at);
        break;
    case SoundLane::Kind::sum:
        for (const float* at = samples; at < end; at += channels) {
            float sum = 0;
            for (int channel = 0; channel < channels; ++channel)
                sum += at[channel];
            extremes.add(sum / static_cast<float>(channels));
        }
        break;
    case SoundLane::Kind::halves:
        extremes.low = extremes.high = 0;
        for (const float* at = samples; at < end; at += 2) {
            extremes.add(std::abs(at[0]));
            extremes.add(-std::abs(at[1]));
        }
        break;
    case SoundLane::Kind::folded:
        extremes.low = extremes.high = 0;
        for (const float* at = samples; at < end; ++at)
            extremes.add(*at);
        break;
    }
    if (extremes.low > extremes.high) // nothing but NaNs
        extremes.low = extremes.high = 0;
    return extremes;
}

} // namespace

SampleColumns::SampleColumns(const std::vector<SoundLane>& lanes, int channels, double first, double framesPerColumn,
                             std::size_t columns)
    : lanes_(lanes),
      channels_(channels),
      first_(first),
      framesPerColumn_(framesPerColumn),
      columns_(columns),
      folds_(lanes.size(), std::vector<Fold>(columns))
{
}

// A column that ends where a frame begins has nothing of it, whatever rounding says.
constexpr double kSlack = 1e-6;

std::int64_t SampleColumns::begin(std::size_t column) const
{
    return static_cast<std::int64_t>(std::floor(first_ + framesPerColumn_ * static_cast<double>(column) + kSlack));
}

std::int64_t SampleColumns::end(std::size_t column) const
{
    return static_cast<std::int64_t>(std::ceil(first_ + framesPerColumn_ * static_cast<double>(column + 1) - kSlack));
}

void SampleColumns::add(const float* samples, std::int64_t frame, std::int64_t frames)
{
    const std::int64_t stop = frame + frames;
    while (open_ < columns_ && end(open_) <= frame)
        ++open_;
    for (std::size_t column = open_; column < columns_ && begin(column) < stop; ++column) {
        const std::int64_t until = std::min(end(column), stop);
        for (std::int64_t from = std::max(begin(column), frame); from < until; from += kRun) {
            const std::int64_t count = std::min(kRun, until - from);
            const float* const run = samples + (from - frame) * channels_;
            for (std::size_t lane = 0; lane < lanes_.size(); ++lane) {
                const Extremes extremes = extremesOf(lanes_[lane], run, count, channels_);
                Fold& fold = folds_[lane][column];
                fold.low = fold.frames > 0 ? std::min(fold.low, extremes.low) : extremes.low;
                fold.high = fold.frames > 0 ? std::max(fold.high, extremes.high) : extremes.high;
                fold.lowSum += static_cast<double>(extremes.low) * static_cast<double>(count);
                fold.highSum += static_cast<double>(extremes.high) * static_cast<double>(count);
                fold.frames += count;
            }
        }
    }
}

std::vector<WaveformColumn> SampleColumns::take(std::size_t lane)
{
    std::vector<WaveformColumn> columns;
    columns.reserve(columns_);
    for (const Fold& fold : folds_[lane]) {
        const double frames = static_cast<double>(std::max<std::int64_t>(fold.frames, 1));
        columns.push_back(
            {fold.low, fold.high, static_cast<float>(fold.lowSum / frames), static_cast<float>(fold.highSum / frames)});
    }
    folds_[lane].clear();
    return columns;
}
