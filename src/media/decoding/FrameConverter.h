// Frames of linear PCM to another sample format and channel count, by the shared sample conversions.
#pragma once

#include "media/samples/StreamDescription.h"

#include <cstddef>
#include <vector>

namespace platform {

/// Takes its memory when it is made, none when it converts. Both formats must be packed PCM (isPackedPCM).
class FrameConverter {
public:
    FrameConverter() = default;
    FrameConverter(const StreamDescription& from, const StreamDescription& to);

    /// Nothing to do: frames can be read where they are wanted.
    bool isCopy() const { return road_ == Road::copy; }
    /// Floats may be NaN or infinite; integers are neither.
    bool mayGiveNoNumbers() const { return from_.isFloat; }
    /// How many frames are converted at a time.
    std::size_t piece() const { return piece_; }
    /// `frames` is at most piece(); `from` and `to` do not overlap. `to` is aligned for floats when it is to hold them.
    void convert(const std::byte* from, std::byte* to, std::size_t frames);

private:
    enum class Road { copy, swap, toFloats, byFloats, mix };

    Road roadOf() const;
    void mix(const float* from, float* to, std::size_t frames) const;

    SampleFormat from_, to_;
    std::size_t fromChannels_ = 1, toChannels_ = 1;
    std::size_t piece_ = 1;
    Road road_ = Road::copy;
    std::vector<float> floats_; // in the channels that come
    std::vector<float> mixed_;  // in those that are wanted
};

} // namespace platform
