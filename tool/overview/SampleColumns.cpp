#include "tool/overview/SampleColumns.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>

namespace {

constexpr std::int64_t kRun = kOverviewFramesPerPoint;

struct Extremes {
    float low = std::numeric_limits<float>::infinity(), high = -low;

    // A NaN fails both comparisons.
    void add(float sample)
    {
        low = sample < low ? sample : low;
        high = sample > high ? sample : high;
    }
};

// Number of samples processed side by side, which the compiler vectorizes. If the number of channels divides it, each
// position belongs to one channel, so one pass finds the extremes of all.
constexpr int kSide = 16;

constexpr bool divides(int channels)
{
    return kSide % channels == 0;
}

class SideBySide {
public:
    // For a number of channels that divides kSide.
    void fold(const float* samples, std::int64_t count)
    {
        low_.fill(std::numeric_limits<float>::infinity());
        high_.fill(-std::numeric_limits<float>::infinity());
        std::int64_t done = 0;
        for (; done + kSide <= count; done += kSide)
            for (std::size_t i = 0; i < kSide; ++i) {
                const float sample = samples[done + static_cast<std::int64_t>(i)];
                low_[i] = sample < low_[i] ? sample : low_[i];
                high_[i] = sample > high_[i] ? sample : high_[i];
            }
        for (std::size_t i = 0; done < count; ++done, ++i) {
            low_[i] = samples[done] < low_[i] ? samples[done] : low_[i];
            high_[i] = samples[done] > high_[i] ? samples[done] : high_[i];
        }
    }

    Extremes ofChannel(int channel, int channels) const
    {
        Extremes extremes;
        for (auto i = static_cast<std::size_t>(channel); i < kSide; i += static_cast<std::size_t>(channels)) {
            extremes.low = std::min(extremes.low, low_[i]); // infinite if there were no samples
            extremes.high = std::max(extremes.high, high_[i]);
        }
        return extremes;
    }

private:
    std::array<float, kSide> low_, high_;
};

Extremes ofChannel(const float* samples, std::int64_t frames, int channel, int channels)
{
    Extremes extremes;
    for (const float* at = samples + channel; at < samples + frames * channels; at += channels)
        extremes.add(*at);
    return extremes;
}

Extremes ofSum(const float* samples, std::int64_t frames, int channels)
{
    Extremes extremes;
    for (const float* at = samples; at < samples + frames * channels; at += channels) {
        float sum = 0;
        for (int channel = 0; channel < channels; ++channel)
            sum += at[channel];
        extremes.add(sum / static_cast<float>(channels));
    }
    return extremes;
}

// Finds the extremes of frames for each lane.
class RunExtremes {
public:
    RunExtremes(const float* samples, std::int64_t frames, int channels)
        : samples_(samples),
          frames_(frames),
          channels_(channels)
    {
        if (divides(channels))
            all_.fold(samples, frames * channels);
    }

    Extremes of(const SoundLane& lane) const
    {
        Extremes extremes;
        switch (lane.kind) {
        case SoundLane::Kind::channel:
            extremes = ofChannel(lane.channel);
            break;
        case SoundLane::Kind::sum:
            extremes = ofSum(samples_, frames_, channels_);
            break;
        case SoundLane::Kind::halves: {
            const Extremes left = ofChannel(0), right = ofChannel(1);
            extremes.low = std::min({0.0F, right.low, -right.high});
            extremes.high = std::max({0.0F, left.high, -left.low});
            break;
        }
        case SoundLane::Kind::folded:
            extremes.low = extremes.high = 0;
            for (int channel = 0; channel < channels_; ++channel) {
                const Extremes one = ofChannel(channel);
                extremes.add(one.low);
                extremes.add(one.high);
            }
            break;
        }
        if (extremes.low > extremes.high) // only NaNs
            extremes.low = extremes.high = 0;
        return extremes;
    }

private:
    Extremes ofChannel(int channel) const
    {
        const Extremes extremes = divides(channels_) ? all_.ofChannel(channel, channels_)
                                                     : ::ofChannel(samples_, frames_, channel, channels_);
        return extremes.low > extremes.high ? Extremes{0, 0} : extremes;
    }

    const float* samples_;
    std::int64_t frames_;
    int channels_;
    SideBySide all_;
};

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

// A column that ends where a frame begins contains none of it, despite rounding.
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
            const RunExtremes run(samples + (from - frame) * channels_, count, channels_);
            for (std::size_t lane = 0; lane < lanes_.size(); ++lane) {
                const Extremes extremes = run.of(lanes_[lane]);
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
