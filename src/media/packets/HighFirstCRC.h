// Cyclic redundancy checks that process each byte from its highest bit, as in FLAC frames and Ogg pages. ECCRC32
// (platform/core) begins with the lowest.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Packed.h"

#include <array>
#include <cstdint>

namespace platform {

/// Remainder of the division by a polynomial of `width` bits, 8 to 32, with initial value zero. `previous` is the
/// remainder of the bytes before.
template <unsigned width, std::uint32_t polynomial>
std::uint32_t highFirstCRC(BytesView bytes, std::uint32_t previous = 0)
{
    constexpr unsigned unused = 32 - width; // low bits of the register
    // Contribution of a byte that is followed by as many bytes as the table's index, so that four bytes are processed
    // at a time.
    static constexpr auto tables = [] {
        std::array<std::array<std::uint32_t, 256>, 4> made{};
        for (std::uint32_t value = 0; value < 256; ++value) {
            std::uint32_t crc = value << 24;
            for (int bit = 0; bit < 8; ++bit)
                crc = crc << 1 ^ (crc >> 31 != 0 ? polynomial << unused : 0);
            made[0][value] = crc;
        }
        for (std::size_t table = 1; table < made.size(); ++table)
            for (std::size_t value = 0; value < 256; ++value) {
                const std::uint32_t crc = made[table - 1][value];
                made[table][value] = crc << 8 ^ made[0][crc >> 24];
            }
        return made;
    }();
    std::uint32_t crc = previous << unused;
    for (; bytes.size() >= 4; bytes = bytes.subspan(4)) {
        crc ^= loadBE<std::uint32_t>(bytes.data());
        crc = tables[3][crc >> 24] ^ tables[2][crc >> 16 & 0xFF] ^ tables[1][crc >> 8 & 0xFF] ^ tables[0][crc & 0xFF];
    }
    for (const std::byte byte : bytes)
        crc = crc << 8 ^ tables[0][crc >> 24 ^ std::to_integer<std::uint32_t>(byte)];
    return crc >> unused;
}

} // namespace platform
