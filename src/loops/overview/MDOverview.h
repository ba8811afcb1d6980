// MDOverview fills an overview block while audio streams by.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "media/samples/SampleConversion.h"

#include <cstdint>

/// Fills a block, which it does not own. The caller sizes it for the whole file (OverviewBlockSize) and fills it with
/// zeros; it outlives the accumulator or is detached by Finalize. Frames without room in the block are dropped.
/// Samples are contiguous while each start frame is where the last call ended; any other start frame begins a new
/// point.
class KT_EXPORT MDOverview {
public:
    /// The greatest number of channels; Add and AddStored ignore frames with more.
    static constexpr int kMostChannels = 2048;

    /// `block` may be null, for no overview.
    explicit MDOverview(KTMem* block) : block_(block) {}
    MDOverview(const MDOverview&) = delete;
    MDOverview& operator=(const MDOverview&) = delete;

    /// Adds frames of signed 8-bit samples, `stride` bytes apart. With `firstByte` 0 a sample is the last byte of its
    /// stride, the most significant one of wider little-endian samples; otherwise the first.
    void Add(const std::int8_t* samples, long start, long frames, int channels, int stride, int firstByte);
    /// Adds frames of interleaved floats: each is multiplied by 128, rounded half to even and clamped. A NaN is
    /// silence.
    void Add(const float* samples, long start, long frames, int channels);
    /// Adds frames of interleaved samples as they are stored, with the same result as by way of floats.
    void AddStored(const void* samples, platform::SampleFormat format, long start, long frames, int channels);
    /// Raises points after the added ones for a quick picture, of peaks only, while a recording runs: mono floats, at
    /// first from the next expected frame on, then from where the last call ended.
    void AddRough(const float* samples, long frames);
    /// Sets the frame count, shrinks the block to the points that it needs, returns it and forgets it; null when
    /// there is none.
    KTMem* Finalize();

private:
    bool HasRoomAt(long start) const;
    /// Adds frames; `fold(frame, frames)` gives the extremes of `frames` frames from the added frame `frame`
    /// on.
    template <class Fold>
    void AddFrames(long start, long frames, Fold fold);

    std::int32_t minimum_ = 0; // of the open point
    std::int32_t maximum_ = 0;
    std::int32_t missingFrames_ = static_cast<std::int32_t>(kOverviewFramesPerPoint); // in the open point
    std::int8_t roughPeak_ = 0;
    std::int16_t roughCountdown_ = 0;
    KTMem* block_;
    std::int64_t nextFrame_ = 0;
    std::int64_t roughFrame_ = 0;
};
