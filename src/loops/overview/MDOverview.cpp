#include "loops/overview/MDOverview.h"

#include "media/samples/SampleExtremes.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdlib>

namespace {

constexpr int kHighest = 127;
constexpr long kPointFrames = kOverviewFramesPerPoint;
constexpr platform::SampleFormat kOwnFloats{32, true, false, std::endian::native};

// The lowest and highest value so far, zero included, before clamping.
struct Extremes {
    int lowest = 0;
    int highest = 0;
};

Extremes extremesOfBytes(const std::int8_t* samples, long frames, int channels, std::ptrdiff_t stride)
{
    Extremes extremes;
    for (long i = 0; i < frames * channels; ++i) {
        const int sample = samples[i * stride];
        if (channels != 2) {
            extremes.lowest = std::min(extremes.lowest, sample);
            extremes.highest = std::max(extremes.highest, sample);
        } else if (i % 2 == 0) {
            extremes.highest = std::max(extremes.highest, std::abs(sample));
        } else {
            extremes.lowest = std::min(extremes.lowest, -std::abs(sample));
        }
    }
    return extremes;
}

// The extremes of samples in any format. Rounding preserves order, so only the extremes of a point are rounded;
// consecutive whole points are computed in batches.
class StoredSamples {
public:
    StoredSamples(const void* samples, platform::SampleFormat format, long frames, int channels)
        : samples_(static_cast<const std::byte*>(samples)),
          format_(format),
          frames_(frames),
          channels_(channels)
    {
    }

    Extremes operator()(long frame, long frames)
    {
        if (frames < kPointFrames) {
            foldRuns(frame, frames, 1);
            return runAt(0);
        }
        if (frame >= batchEnd_) {
            const long runs = std::min(kBatch, (frames_ - frame) / kPointFrames);
            foldRuns(frame, kPointFrames, runs);
            batchStart_ = frame;
            batchEnd_ = frame + runs * kPointFrames;
        }
        return runAt(static_cast<std::size_t>((frame - batchStart_) / kPointFrames));
    }

private:
    static constexpr long kBatch = 32;
    struct Rounded {
        std::array<std::int8_t, 2> lowest, highest; // of even and odd samples
    };
    static_assert(4 * sizeof(float) == sizeof(platform::SampleExtremes) && sizeof(Rounded) == 4);

    void foldRuns(long frame, long framesPerRun, long runs)
    {
        constexpr platform::SampleFormat bytes{8, false, false, std::endian::native};
        std::array<platform::SampleExtremes, kBatch> extremes;
        const auto count = static_cast<std::size_t>(runs);
        const std::byte* from = samples_ + std::ptrdiff_t{frame} * channels_ * format_.bytesPerSample();
        platform::sampleExtremes(from, format_, static_cast<std::size_t>(framesPerRun * channels_), count,
                                 extremes.data());
        platform::floatToSamples(extremes.front().lowest, bytes, rounded_.data(), 4 * count);
    }

    Extremes runAt(std::size_t index) const
    {
        const auto& [lowest, highest] = rounded_[index];
        if (channels_ != 2)
            return {std::min(lowest[0], lowest[1]), std::max(highest[0], highest[1])};
        return {std::min<int>(lowest[1], -highest[1]), std::max<int>(highest[0], -lowest[0])};
    }

    const std::byte* samples_;
    platform::SampleFormat format_;
    long frames_;
    int channels_;
    long batchStart_ = 0;
    long batchEnd_ = 0;
    std::array<Rounded, kBatch> rounded_;
};

} // namespace

bool MDOverview::HasRoomAt(long start) const
{
    // Kept: a start just behind the last point is accepted, although nothing of it can be stored.
    return block_ != nullptr && block_->size() >= kOverviewHeaderSize && start >= 0 &&
           static_cast<std::size_t>(start / kPointFrames) <= OverviewPoints(*block_);
}

template <class Fold>
void MDOverview::AddFrames(long start, long frames, Fold fold)
{
    long end = 0;
    if (!HasRoomAt(start) || frames < 0 || __builtin_add_overflow(start, frames, &end))
        return;
    if (start != nextFrame_) {
        minimum_ = maximum_ = 0;
        missingFrames_ = static_cast<std::int32_t>(kPointFrames - start % kPointFrames);
    }
    nextFrame_ = end;

    OverviewPoint* points = OverviewPointsOf(*block_);
    const std::size_t count = OverviewPoints(*block_);
    auto point = static_cast<std::size_t>(start / kPointFrames);
    for (long done = 0; done < frames;) {
        const long part = std::min<long>(frames - done, missingFrames_);
        const Extremes extremes = fold(done, part);
        minimum_ = std::max(std::min(minimum_, extremes.lowest), -kHighest);
        maximum_ = std::min(std::max(maximum_, extremes.highest), kHighest);
        if (point < count)
            points[point] = {static_cast<std::int8_t>(minimum_), static_cast<std::int8_t>(maximum_)};
        done += part;
        missingFrames_ -= static_cast<std::int32_t>(part);
        if (missingFrames_ == 0) {
            point = std::min(point + 1, count);
            minimum_ = maximum_ = 0;
            missingFrames_ = kPointFrames;
        }
    }
    SetOverviewFrames(*block_, static_cast<std::int64_t>(point) * kPointFrames);
}

void MDOverview::Add(const std::int8_t* samples, long start, long frames, int channels, int stride, int firstByte)
{
    if (samples == nullptr || channels < 1 || stride < 1)
        return;
    const std::int8_t* first = samples + (firstByte != 0 ? 0 : stride - 1);
    AddFrames(start, frames, [=](long frame, long count) {
        return extremesOfBytes(first + std::ptrdiff_t{frame} * channels * stride, count, channels, stride);
    });
}

void MDOverview::Add(const float* samples, long start, long frames, int channels)
{
    if (channels < 1 || channels > kMostChannels)
        return;
    // Kept: slices decide where frames beyond the block's end stop counting.
    const long slice = kMostChannels / channels;
    for (long done = 0; done < frames; done += slice)
        AddStored(samples + std::ptrdiff_t{done} * channels, kOwnFloats, start + done, std::min(slice, frames - done),
                  channels);
}

void MDOverview::AddStored(const void* samples, platform::SampleFormat format, long start, long frames, int channels)
{
    if (samples == nullptr || channels < 1 || channels > kMostChannels || !format.isSupported())
        return;
    AddFrames(start, frames, StoredSamples(samples, format, frames, channels));
}

void MDOverview::AddRough(const float* samples, long frames)
{
    constexpr std::int16_t callsPerPeak = 16;
    if (block_ == nullptr || block_->size() < kOverviewHeaderSize || samples == nullptr || frames < 0)
        return;
    if (roughFrame_ == 0)
        roughFrame_ = nextFrame_;
    if (roughFrame_ < 1 || roughFrame_ < nextFrame_)
        return;
    if (--roughCountdown_ < 1) {
        roughCountdown_ = callsPerPeak;
        roughPeak_ = 0;
    }
    OverviewPoint* points = OverviewPointsOf(*block_);
    const auto count = static_cast<std::int64_t>(OverviewPoints(*block_));
    std::int64_t point = roughFrame_ / kPointFrames;
    long missing = kPointFrames - static_cast<long>(roughFrame_ % kPointFrames);
    for (long done = 0; done < frames && point < count; ++point) {
        const long part = std::min(frames - done, missing);
        float highest = 0;
        for (long i = done; i < done + part; ++i)
            highest = samples[i] > highest ? samples[i] : highest; // passes over a NaN
        const auto peak = static_cast<std::int8_t>(std::min(highest * kHighest, static_cast<float>(kHighest)));
        roughPeak_ = std::max(roughPeak_, peak);
        if (roughPeak_ > points[point].maximum)
            points[point] = {static_cast<std::int8_t>(-roughPeak_), roughPeak_};
        done += part;
        missing = kPointFrames;
        SetOverviewFrames(*block_, (point + 1) * kPointFrames);
    }
    roughFrame_ += frames;
}

KTMem* MDOverview::Finalize()
{
    KTMem* block = block_;
    block_ = nullptr;
    if (block == nullptr || block->size() < kOverviewHeaderSize)
        return block;
    SetOverviewFrames(*block, nextFrame_);
    block->reallocate(std::min(block->size(), OverviewBlockSize(nextFrame_)));
    return block;
}
