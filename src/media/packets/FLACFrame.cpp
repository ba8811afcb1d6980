#include "media/packets/FLACFrame.h"

#include "media/packets/HighFirstCRC.h"
#include "platform/core/Packed.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>

namespace platform {

namespace {

// Codes of block sizes and sample rates in a frame's header (RFC 9639, 9.1.1 and 9.1.2). Some refer to a number of one
// or two bytes, which stands after the frame's own number.

std::size_t bytesOfFLACBlockSize(std::uint32_t code)
{
    switch (code) {
    case 6:
        return 1;
    case 7:
        return 2;
    default:
        return 0;
    }
}

std::uint32_t flacBlockSize(std::uint32_t code, const std::byte* number)
{
    switch (code) {
    case 1:
        return 192;
    case 6:
        return std::to_integer<std::uint32_t>(*number) + 1;
    case 7:
        return loadBE<std::uint16_t>(number) + 1U;
    default:
        return code < 6 ? 144U << code : 1U << code;
    }
}

std::size_t bytesOfFLACRate(std::uint32_t code)
{
    switch (code) {
    case 12:
        return 1;
    case 13:
    case 14:
        return 2;
    default:
        return 0;
    }
}

std::uint32_t flacRate(std::uint32_t code, const std::byte* number)
{
    constexpr std::array<std::uint32_t, 12> rates{0,     88200, 176400, 192000, 8000,  16000,
                                                  22050, 24000, 32000,  44100,  48000, 96000};
    switch (code) {
    case 12:
        return std::to_integer<std::uint32_t>(*number) * 1000;
    case 13:
        return loadBE<std::uint16_t>(number);
    case 14:
        return loadBE<std::uint16_t>(number) * 10U;
    default:
        return rates[code];
    }
}

} // namespace

std::optional<FLACFrame> parseFLACFrame(BytesView bytes, std::uint32_t blockSize)
{
    constexpr std::size_t kMostHeader = 16, kFixedSize = 4;
    constexpr std::array<std::uint32_t, 8> bits{0, 8, 12, 0, 16, 20, 24, 32};
    bytes = bytes.first(std::min(bytes.size(), kMostHeader));
    if (bytes.size() < kFixedSize + 2)
        return {};
    const auto fixed = loadBE<std::uint32_t>(bytes.data());
    if (fixed >> 17 != 0x7FFC || (fixed & 1) != 0) // sync and a reserved 0; a second reserved 0
        return {};
    // Number of the frame, or of its first sample if sizes differ, coded like a character in UTF-8.
    const auto first = std::to_integer<std::uint8_t>(bytes[kFixedSize]);
    const int ones = std::countl_one(first);
    const std::size_t length = ones == 0 ? 1 : static_cast<std::size_t>(ones);
    if (ones == 1 || ones == 8 || bytes.size() < kFixedSize + length + 3)
        return {};
    std::uint64_t number = ones == 0 ? first : first & (0x7FU >> ones);
    std::size_t at = kFixedSize + 1;
    for (; at < kFixedSize + length; ++at)
        number = number << 6 | (std::to_integer<std::uint64_t>(bytes[at]) & 0x3F);
    const std::uint32_t code = fixed >> 12 & 15;
    const std::size_t sizeBytes = bytesOfFLACBlockSize(code);
    const std::uint32_t rate = fixed >> 8 & 15;
    const std::size_t rateBytes = bytesOfFLACRate(rate);
    if (code == 0 || rate == 15 || bytes.size() < at + sizeBytes + rateBytes + 1)
        return {};
    FLACFrame frame;
    frame.samples = flacBlockSize(code, bytes.data() + at);
    at += sizeBytes;
    frame.sampleRate = flacRate(rate, bytes.data() + at);
    at += rateBytes;
    if (highFirstCRC<8, 0x07>(bytes.first(at)) != std::to_integer<std::uint32_t>(bytes[at]))
        return {};
    const bool countsSamples = (fixed >> 16 & 1) != 0;
    frame.first = countsSamples ? number : number * blockSize;
    frame.channels = (fixed >> 4 & 8) != 0 ? 2 : (fixed >> 4 & 7) + 1; // a stereo mode, or independent channels
    frame.bits = bits[fixed >> 1 & 7];
    return frame;
}

} // namespace platform
