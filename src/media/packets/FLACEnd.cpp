#include "media/packets/FLACEnd.h"

#include "platform/core/Packed.h"

#include <array>
#include <bit>
#include <optional>

namespace platform {

namespace {

/// The remainder of a division by a polynomial of `width` bits, the highest bit first (RFC 9639, 9.1.8 and 9.3).
template <unsigned width, std::uint32_t polynomial>
std::uint32_t checksum(BytesView bytes)
{
    static constexpr auto table = [] {
        std::array<std::uint32_t, 256> made{};
        for (std::uint32_t value = 0; value < made.size(); ++value) {
            std::uint32_t crc = value << (width - 8);
            for (int bit = 0; bit < 8; ++bit)
                crc = crc << 1 ^ ((crc >> (width - 1) & 1) != 0 ? polynomial : 0);
            made[value] = crc & ((1U << width) - 1);
        }
        return made;
    }();
    std::uint32_t crc = 0;
    for (const std::byte byte : bytes)
        crc = (crc << 8 ^ table[(crc >> (width - 8) ^ std::to_integer<std::uint32_t>(byte)) & 0xFF]) &
              ((1U << width) - 1);
    return crc;
}

/// The number behind the last sample of the frame that begins here; none when no frame does.
std::optional<std::uint64_t> endOfFrame(BytesView bytes, std::uint32_t blockSize)
{
    constexpr std::size_t kMostHeader = 16, kFixedSize = 4;
    bytes = bytes.first(std::min(bytes.size(), kMostHeader));
    if (bytes.size() < kFixedSize + 2)
        return {};
    const auto fixed = loadBE<std::uint32_t>(bytes.data());
    if (fixed >> 17 != 0x7FFC || (fixed & 1) != 0) // sync, a reserved bit of 0; and another one
        return {};
    // Of the frame, or where sizes differ of its first sample, coded like a character in UTF-8.
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
    const std::size_t sizeBytes = code == 6 ? 1 : code == 7 ? 2 : 0;
    const std::uint32_t rate = fixed >> 8 & 15;
    const std::size_t rateBytes = rate == 12 ? 1 : rate == 13 || rate == 14 ? 2 : 0;
    if (code == 0 || rate == 15 || bytes.size() < at + sizeBytes + rateBytes + 1)
        return {};
    const std::uint32_t size = code == 1   ? 192
                               : code <= 5 ? 144U << code
                               : code == 6 ? std::to_integer<std::uint32_t>(bytes[at]) + 1
                               : code == 7 ? loadBE<std::uint16_t>(bytes.data() + at) + 1U
                                           : 1U << code;
    at += sizeBytes + rateBytes;
    if (checksum<8, 0x07>(bytes.first(at)) != std::to_integer<std::uint32_t>(bytes[at]))
        return {};
    const bool countsSamples = (fixed >> 16 & 1) != 0;
    return (countsSamples ? number : number * blockSize) + size;
}

} // namespace

bool flacEndsAt(BytesView tail, std::uint64_t samples, std::uint32_t blockSize)
{
    constexpr std::size_t kSmallestFrame = 10;
    for (std::size_t at = tail.size(); at-- > 0;) {
        const BytesView rest = tail.subspan(at);
        if (rest[0] != std::byte{0xFF} || rest.size() < kSmallestFrame)
            continue;
        const auto end = endOfFrame(rest, blockSize);
        if (end == samples && checksum<16, 0x8005>(rest) == 0) // with its own checksum behind it
            return true;
    }
    return false;
}

} // namespace platform
