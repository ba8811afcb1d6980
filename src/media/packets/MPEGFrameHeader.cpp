#include "media/packets/MPEGFrameHeader.h"

#include "platform/core/Packed.h"

#include <array>

namespace platform {

namespace {

// Kilobits per second by the header's index; 0 is "free format", 15 is invalid.
constexpr std::array<std::uint16_t, 15> kBitRatesMPEG1 = {0,   32,  40,  48,  56,  64,  80, 96,
                                                          112, 128, 160, 192, 224, 256, 320};
constexpr std::array<std::uint16_t, 15> kBitRatesMPEG2 = {0, 8, 16, 24, 32, 40, 48, 56, 64, 80, 96, 112, 128, 144, 160};
constexpr std::array<std::uint32_t, 3> kSampleRatesMPEG1 = {44100, 48000, 32000};

} // namespace

std::optional<MPEGFrameHeader> MPEGFrameHeader::parse(const std::byte* bytes)
{
    // Bits: sync 11, version 2, layer 2, no CRC 1, bit rate 4, sample rate 2, padding 1, private 1, mode 2, …, emphasis
    // 2
    const auto bits = loadBE<std::uint32_t>(bytes);
    const std::uint32_t version = bits >> 19 & 3;
    const std::uint32_t layer = bits >> 17 & 3;
    const std::uint32_t bitRate = bits >> 12 & 15;
    const std::uint32_t sampleRate = bits >> 10 & 3;
    if (bits >> 21 != 0x7FF || version == 1 || layer != 1 || bitRate == 0 || bitRate == 15 || sampleRate == 3 ||
        (bits & 3) == 2)
        return {};
    MPEGFrameHeader header;
    header.version = static_cast<Version>(version);
    header.hasCRC = (bits >> 16 & 1) == 0;
    header.channels = (bits >> 6 & 3) == 3 ? 1 : 2;
    header.sampleRate = kSampleRatesMPEG1[sampleRate] >> (version == 3 ? 0 : version == 2 ? 1 : 2);
    const std::uint32_t padding = bits >> 9 & 1;
    header.frameSize = static_cast<std::uint16_t>(
        header.bytesAt(header.isMPEG1() ? kBitRatesMPEG1[bitRate] : kBitRatesMPEG2[bitRate]) + padding);
    return header;
}

} // namespace platform
