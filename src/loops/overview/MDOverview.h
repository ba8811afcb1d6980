// MDOverview fills an overview block while audio streams by.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "media/samples/SampleConversion.h"

#include <cstdint>

/// Does not own the block, which the caller has sized for the whole file (OverviewBlockSize) and filled with zeros, and
/// which outlives the accumulator or is detached by Finalize. Frames that the block has no room for are dropped.
/// Samples follow each other without a gap as long as each start frame is where the last call ended; any other start
/// frame begins a point anew.
class KT_EXPORT MDOverview {
public:
    /// Frames of floats, and of stored samples, with more channels are not taken.
    static constexpr int kMostChannels = 2048;

    explicit MDOverview(KTMem* block) : block_(block) {}
    MDOverview(const MDOverview&) = delete;
    MDOverview& operator=(const MDOverview&) = delete;

    /// Adds frames of signed 8-bit samples, `stride` bytes apart. With `firstByte` 0 a sample is the last byte of its
    /// stride, which of wider little-endian samples is the most significant one, else the first.
    void Add(const std::int8_t* samples, long start, long frames, int channels, int stride, int firstByte);
    /// Adds frames of interleaved floats: each is multiplied by 128, rounded half to even and clamped. A NaN is
    /// silence.
    void Add(const float* samples, long start, long frames, int channels);
    /// Adds frames of interleaved samples as they are stored, with the same result as by way of floats.
    void AddStored(const void* samples, platform::SampleFormat format, long start, long frames, int channels);
    /// Raises points behind those added to a quick picture, of peaks only, while a recording runs: mono floats, from
    /// the next expected frame on at first, then from where the last call ended.
    void AddRough(const float* samples, long frames);
    /// Sets the frame count, shrinks the block to the points that it needs, hands it back and forgets it; null when
    /// there is none.
    KTMem* Finalize();

private:
    bool HasRoomAt(long start) const;
    /// Adds frames whose extremes `fold(frame, frames)` tells: those of `frames` frames from the added frame `frame`
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
