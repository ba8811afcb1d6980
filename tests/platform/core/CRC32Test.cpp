#include "platform/core/CRC32.h"

#include <gtest/gtest.h>

#include <numeric>
#include <vector>

namespace {

/// The definition, bit by bit.
std::uint32_t bitwiseCRC32(std::uint32_t previous, const unsigned char* bytes, std::size_t count)
{
    std::uint32_t crc = ~previous;
    for (std::size_t i = 0; i < count; ++i) {
        crc ^= bytes[i];
        for (int bit = 0; bit < 8; ++bit)
            crc = (crc & 1U) != 0 ? crc >> 1 ^ 0xEDB88320U : crc >> 1;
    }
    return ~crc;
}

TEST(CRC32, IsTheStandardOneInPiecesOfAnySize)
{
    EXPECT_EQ(ECCRC32(0, "123456789", 9), 0xCBF43926U);

    std::vector<unsigned char> bytes(1000);
    std::iota(bytes.begin(), bytes.end(), static_cast<unsigned char>(3));
    const std::uint32_t whole = bitwiseCRC32(0, bytes.data(), bytes.size());
    for (const std::size_t cut : {0U, 1U, 7U, 8U, 63U, 500U, 999U, 1000U}) {
        const std::uint32_t first = ECCRC32(0, bytes.data(), cut);
        EXPECT_EQ(first, bitwiseCRC32(0, bytes.data(), cut));
        EXPECT_EQ(ECCRC32(first, bytes.data() + cut, bytes.size() - cut), whole) << cut;
    }
}

TEST(CRC32, AnEmptyPieceWithoutBytesKeepsWhatWasFolded)
{
    EXPECT_EQ(ECCRC32(0xCBF43926U, nullptr, 0), 0xCBF43926U);
}

} // namespace
