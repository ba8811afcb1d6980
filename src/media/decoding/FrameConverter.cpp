#include "media/decoding/FrameConverter.h"

#include <algorithm>
#include <cstring>

namespace platform {

namespace {

constexpr std::size_t kPieceBytes = 64 * 1024;

/// Samples of one byte get the processor's byte order, because they have none.
SampleFormat normalized(SampleFormat format)
{
    if (format.bits == 8)
        format.order = std::endian::native;
    return format;
}

bool isNativeFloat(const SampleFormat& format)
{
    return format.isFloat && format.bits == 32 && format.order == std::endian::native;
}

} // namespace

FrameConverter::FrameConverter(const StreamDescription& from, const StreamDescription& to)
    : from_(normalized(from.sampleFormat())),
      to_(normalized(to.sampleFormat())),
      fromChannels_(from.channelsPerFrame),
      toChannels_(to.channelsPerFrame)
{
    road_ = roadOf();
    const std::size_t most = std::max({std::size_t{from.bytesPerFrame}, std::size_t{to.bytesPerFrame},
                                       fromChannels_ * sizeof(float), toChannels_ * sizeof(float)});
    piece_ = std::max<std::size_t>(1, kPieceBytes / most);
    if (road_ == Road::byFloats || road_ == Road::mix)
        floats_.resize(piece_ * fromChannels_);
    if (road_ == Road::mix)
        mixed_.resize(piece_ * toChannels_);
}

FrameConverter::Road FrameConverter::roadOf() const
{
    if (fromChannels_ != toChannels_)
        return Road::mix;
    SampleFormat swapped = from_;
    swapped.order = to_.order;
    if (swapped == to_)
        return from_ == to_ ? Road::copy : Road::swap;
    return isNativeFloat(to_) ? Road::toFloats : Road::byFloats;
}

void FrameConverter::convert(const std::byte* from, std::byte* to, std::size_t frames)
{
    const std::size_t samples = frames * fromChannels_;
    const auto size = samples * static_cast<std::size_t>(from_.bytesPerSample());
    switch (road_) {
    case Road::copy:
        std::memcpy(to, from, size);
        return;
    case Road::swap:
        std::memcpy(to, from, size);
        return swapSamples(to, from_.bytesPerSample(), samples);
    case Road::toFloats:
        return samplesToFloat(from, from_, reinterpret_cast<float*>(to), samples);
    case Road::byFloats:
        samplesToFloat(from, from_, floats_.data(), samples);
        return floatToSamples(floats_.data(), to_, to, samples);
    case Road::mix:
        samplesToFloat(from, from_, floats_.data(), samples);
        mix(floats_.data(), mixed_.data(), frames);
        return floatToSamples(mixed_.data(), to_, to, frames * toChannels_);
    }
}

void FrameConverter::mix(const float* from, float* to, std::size_t frames) const
{
    for (std::size_t frame = 0; frame < frames; ++frame, from += fromChannels_, to += toChannels_) {
        if (fromChannels_ == 1) {
            std::fill_n(to, toChannels_, *from);
        } else if (toChannels_ == 1) {
            float sum = 0;
            for (std::size_t channel = 0; channel < fromChannels_; ++channel)
                sum += from[channel];
            *to = sum / static_cast<float>(fromChannels_);
        } else {
            const std::size_t kept = std::min(fromChannels_, toChannels_);
            std::copy_n(from, kept, to);
            std::fill(to + kept, to + toChannels_, 0.0F);
        }
    }
}

} // namespace platform
