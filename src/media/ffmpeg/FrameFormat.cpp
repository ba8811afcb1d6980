#include "media/ffmpeg/FrameFormat.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <type_traits>

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace platform::ffmpeg {

namespace {

using Flag = StreamDescription::Flag;

/// A 24-bit sample at the top of a 32-bit integer, in the processor's byte order.
struct Int24 {
    std::array<std::byte, 3> bytes;
};
static_assert(sizeof(Int24) == 3);

template <class To, class From>
To sampleOf(From from)
{
    if constexpr (sizeof(From) == 1) {
        return static_cast<To>((int{from} - 128) * 256); // decoders deliver unsigned bytes
    } else if constexpr (sizeof(To) == 3) {
        constexpr std::size_t low = std::endian::native == std::endian::little ? 1 : 0;
        Int24 to;
        std::memcpy(to.bytes.data(), reinterpret_cast<const char*>(&from) + low, sizeof to);
        return to;
    } else {
        return from;
    }
}

template <class To, class From>
void copyChannel(const From* from, std::size_t step, To* to, std::size_t channels, std::size_t count)
{
    for (std::size_t i = 0; i < count; ++i)
        to[i * channels] = sampleOf<To>(from[i * step]);
}

/// Both samples of a frame by one store, of which two bytes are the next frame's to replace.
void copyStereo(const std::int32_t* left, const std::int32_t* right, Int24* to, std::size_t count)
{
    const auto both = [&](std::size_t i) {
        const auto low = static_cast<std::uint32_t>(left[i]) >> 8, high = static_cast<std::uint32_t>(right[i]) >> 8;
        return low | std::uint64_t{high} << 24;
    };
    for (std::size_t i = 0; i + 1 < count; ++i, to += 2) {
        const std::uint64_t frame = both(i);
        std::memcpy(to, &frame, sizeof frame);
    }
    if (count > 0) {
        const std::uint64_t frame = both(count - 1);
        std::memcpy(to, &frame, 2 * sizeof(Int24));
    }
}

template <class From, class To>
void copyFrames(const AVFrame& frame, std::uint64_t first, std::size_t count, std::size_t channels, std::byte* to)
{
    const auto have = static_cast<std::size_t>(frame.ch_layout.nb_channels);
    const bool isPlanar = av_sample_fmt_is_planar(static_cast<AVSampleFormat>(frame.format)) != 0;
    auto* const samples = reinterpret_cast<To*>(to);
    const auto channel = [&](std::size_t index) {
        const auto* plane = reinterpret_cast<const From*>(frame.extended_data[isPlanar ? index : 0]);
        return isPlanar ? plane + first : plane + first * have + index;
    };
    if (isPlanar && have == 2 && channels == 2) { // one pass over the most common kind
        const From *left = channel(0), *right = channel(1);
        if constexpr (std::is_same_v<To, Int24> && std::endian::native == std::endian::little)
            return copyStereo(left, right, samples, count);
        for (std::size_t i = 0; i < count; ++i) {
            samples[2 * i] = sampleOf<To>(left[i]);
            samples[2 * i + 1] = sampleOf<To>(right[i]);
        }
        return;
    }
    if (have < channels && have > 1)
        std::memset(to, 0, count * channels * sizeof(To));
    for (std::size_t c = 0; c < (have == 1 ? channels : std::min(have, channels)); ++c)
        copyChannel(channel(have == 1 ? 0 : c), isPlanar ? 1 : have, samples + c, channels, count);
}

/// Output format for a decoder's samples; 0 bits if they are not supported.
SampleFormat sampleFormatOf(AVSampleFormat format, int sourceBits)
{
    switch (av_get_packed_sample_fmt(format)) {
    case AV_SAMPLE_FMT_U8:
    case AV_SAMPLE_FMT_S16:
        return {.bits = 16};
    case AV_SAMPLE_FMT_S32: // samples of fewer bits are left-aligned
        return {.bits = sourceBits > 0 && sourceBits <= 24 ? 24 : 32};
    case AV_SAMPLE_FMT_FLT:
        return {.bits = 32, .isFloat = true};
    case AV_SAMPLE_FMT_DBL:
        return {.bits = 64, .isFloat = true};
    default:
        return {.bits = 0};
    }
}

} // namespace

StreamDescription nativePCM(double sampleRate, std::uint32_t channels, SampleFormat sample)
{
    StreamDescription format;
    format.sampleRate = sampleRate;
    format.formatId = StreamDescription::linearPCM;
    format.formatFlags = (sample.isFloat ? Flag::isFloat : Flag::isSignedInteger) | Flag::isPacked |
                         (std::endian::native == std::endian::big ? Flag::isBigEndian : 0u);
    format.framesPerPacket = 1;
    format.channelsPerFrame = channels;
    format.bitsPerChannel = static_cast<std::uint32_t>(sample.bits);
    format.bytesPerPacket = format.bytesPerFrame = static_cast<std::uint32_t>(sample.bytesPerSample()) * channels;
    return format;
}

std::optional<StreamDescription> frameFormatOf(int sourceBits, const AVFrame& frame)
{
    const SampleFormat sample = sampleFormatOf(static_cast<AVSampleFormat>(frame.format), sourceBits);
    if (sample.bits == 0 || frame.ch_layout.nb_channels < 1 || frame.sample_rate < 1)
        return std::nullopt;
    return nativePCM(frame.sample_rate, static_cast<std::uint32_t>(frame.ch_layout.nb_channels), sample);
}

std::uint32_t speakersOf(const AVFrame& frame)
{
    constexpr std::uint64_t inWAVE = 0x3FFFF; // bits that both masks number alike
    const AVChannelLayout& layout = frame.ch_layout;
    return layout.order == AV_CHANNEL_ORDER_NATIVE && (layout.u.mask & ~inWAVE) == 0
               ? static_cast<std::uint32_t>(layout.u.mask)
               : 0;
}

void interleave(const AVFrame& frame, std::uint64_t first, std::size_t count, const StreamDescription& format,
                std::byte* to)
{
    const auto source = av_get_packed_sample_fmt(static_cast<AVSampleFormat>(frame.format));
    const bool isFloat = (format.formatFlags & Flag::isFloat) != 0;
    const std::uint32_t bits = format.bitsPerChannel;
    const std::size_t channels = format.channelsPerFrame;
    if (source == AV_SAMPLE_FMT_FLT && isFloat && bits == 32)
        copyFrames<float, float>(frame, first, count, channels, to);
    else if (source == AV_SAMPLE_FMT_DBL && isFloat && bits == 64)
        copyFrames<double, double>(frame, first, count, channels, to);
    else if (source == AV_SAMPLE_FMT_S16 && !isFloat && bits == 16)
        copyFrames<std::int16_t, std::int16_t>(frame, first, count, channels, to);
    else if (source == AV_SAMPLE_FMT_U8 && !isFloat && bits == 16)
        copyFrames<std::uint8_t, std::int16_t>(frame, first, count, channels, to);
    else if (source == AV_SAMPLE_FMT_S32 && !isFloat && bits == 24)
        copyFrames<std::int32_t, Int24>(frame, first, count, channels, to);
    else if (source == AV_SAMPLE_FMT_S32 && !isFloat && bits == 32)
        copyFrames<std::int32_t, std::int32_t>(frame, first, count, channels, to);
    else
        std::memset(to, 0, count * format.bytesPerFrame);
}

} // namespace platform::ffmpeg
