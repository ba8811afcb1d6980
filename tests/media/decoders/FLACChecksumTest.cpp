#include "media/ffmpeg/FLACChecksum.h"

#include "media/packets/HighFirstCRC.h"

#include <gtest/gtest.h>

#include <random>

using platform::highFirstCRC;
using platform::ffmpeg::flacCRC16;

namespace {

TEST(FLACChecksum, PublishedCheckValue)
{
    EXPECT_EQ(flacCRC16(bytesOf("123456789")), 0xFEE8U);
}

TEST(FLACChecksum, TheFastRoadEqualsThePlainOne)
{
    std::mt19937 random(1);
    Bytes bytes(20003);
    for (std::byte& byte : bytes)
        byte = static_cast<std::byte>(random());
    for (std::size_t offset = 0; offset < 3; ++offset)
        for (std::size_t size = 0; size < 300; ++size) {
            const BytesView part = BytesView(bytes).subspan(offset, size);
            ASSERT_EQ(flacCRC16(part), (highFirstCRC<16, 0x8005>(part))) << size;
        }
    const std::uint32_t crc = highFirstCRC<16, 0x8005>(bytes);
    EXPECT_EQ(flacCRC16(bytes), crc);
    bytes.push_back(static_cast<std::byte>(crc >> 8));
    bytes.push_back(static_cast<std::byte>(crc));
    EXPECT_EQ(flacCRC16(bytes), 0U);
    bytes[777] ^= std::byte{1};
    EXPECT_NE(flacCRC16(bytes), 0U);
}

} // namespace
