#include "media/samples/StreamDescription.h"

namespace platform {

SampleFormat StreamDescription::sampleFormat() const
{
    return {.bits = bitsPerChannel <= 64 ? static_cast<int>(bitsPerChannel) : 0,
            .isFloat = (formatFlags & isFloat) != 0,
            .isUnsigned = !(formatFlags & isFloat) && !(formatFlags & isSignedInteger),
            .order = formatFlags & isBigEndian ? std::endian::big : std::endian::little};
}

StreamDescription StreamDescription::packedPCM(double sampleRate, std::uint32_t channels, SampleFormat sample)
{
    StreamDescription format;
    format.sampleRate = sampleRate;
    format.formatId = linearPCM;
    const bool isUnsigned = sample.isUnsigned || (sample.bits == 8 && sample.order == std::endian::little);
    format.formatFlags = (sample.isFloat ? isFloat
                          : isUnsigned   ? 0u
                                         : isSignedInteger) |
                         isPacked | (sample.order == std::endian::big ? isBigEndian : 0u);
    format.bytesPerPacket = format.bytesPerFrame = static_cast<std::uint32_t>(sample.bytesPerSample()) * channels;
    format.framesPerPacket = 1;
    format.channelsPerFrame = channels;
    format.bitsPerChannel = static_cast<std::uint32_t>(sample.bits);
    return format;
}

} // namespace platform
