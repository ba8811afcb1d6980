// Converts frames of linear PCM to another sample format and channel count.
#pragma once

#include "media/samples/StreamDescription.h"

#include <cstddef>
#include <vector>

namespace platform {

/// Allocates on construction only, never while it converts. Both formats must be packed PCM (isPackedPCM).
class FrameConverter {
public:
    FrameConverter() = default;
    FrameConverter(const StreamDescription& from, const StreamDescription& to);

    /// Whether nothing needs converting, so that frames can be read straight to their destination.
    bool isCopy() const { return road_ == Road::copy; }
    /// Whether the result may contain NaN or infinity, which only floats can be.
    bool mayGiveNoNumbers() const { return from_.isFloat; }
    /// Number of frames converted at a time.
    std::size_t piece() const { return piece_; }
    /// `frames` is at most piece(). `from` and `to` must not overlap; `to` is aligned for floats if it receives them.
    void convert(const std::byte* from, std::byte* to, std::size_t frames);

private:
    enum class Road { copy, swap, toFloats, byFloats, mix };

    Road roadOf() const;
    void mix(const float* from, float* to, std::size_t frames) const;

    SampleFormat from_, to_;
    std::size_t fromChannels_ = 1, toChannels_ = 1;
    std::size_t piece_ = 1;
    Road road_ = Road::copy;
    std::vector<float> floats_; // in the source's channels
    std::vector<float> mixed_;  // in the destination's channels
};

} // namespace platform
