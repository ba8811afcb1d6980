#include "audiofile/AudioFileHeader.h"

#include "MemoryAudioFile.h"
#include "platform/core/Packed.h"

#include <gtest/gtest.h>

namespace {

constexpr FourCC kWAVE = fourCC("WAVE");
constexpr FourCC kAIFF = fourCC("AIFF");
constexpr FourCC kCAF = fourCC("caff");

Bytes build(FourCC type, long long frames, int channels, int bits, bool option = false,
            TAudioBusFormat bus = kAudioBusUndefined, long long rate = 48000)
{
    Bytes header(kMaxAudioFileHeaderSize);
    const long length = BuildAudioFileHeader(header.data(), type, frames, rate, channels, bits, bus, option);
    header.resize(length > 0 ? static_cast<std::size_t>(length) : 0);
    return header;
}

std::string idAt(const Bytes& header, std::size_t offset)
{
    return fourCCText(loadBE<FourCC>(header.data() + offset));
}

TEST(AudioFileHeader, ReservesRoomAndUsesItPast4GiB)
{
    const Bytes small = build(kWAVE, 10, 2, 16, true);
    EXPECT_EQ(idAt(small, 0), "RIFF");
    EXPECT_EQ(idAt(small, 12), "JUNK");
    EXPECT_EQ(loadLE<std::uint32_t>(small.data() + 16), 28U);
    EXPECT_EQ(small.size(), 80U);
    EXPECT_EQ(loadLE<std::uint32_t>(small.data() + 4), 72U + 40U);

    const long long most = (0xFFFFFFFFLL - 72) / 4; // frames of a plain file
    EXPECT_EQ(idAt(build(kWAVE, most, 2, 16, true), 0), "RIFF");
    const Bytes large = build(kWAVE, most + 1, 2, 16, true);
    EXPECT_EQ(idAt(large, 0), "RF64");
    EXPECT_EQ(idAt(large, 12), "ds64");
    EXPECT_EQ(loadLE<std::uint32_t>(large.data() + 4), 0xFFFFFFFFU);
    EXPECT_EQ(loadLE<std::int64_t>(large.data() + 20), 72 + (most + 1) * 4);
    EXPECT_EQ(loadLE<std::int64_t>(large.data() + 28), (most + 1) * 4);
    EXPECT_EQ(loadLE<std::int64_t>(large.data() + 36), most + 1);
    EXPECT_EQ(loadLE<std::uint32_t>(large.data() + 76), 0xFFFFFFFFU);
    EXPECT_EQ(large.size(), small.size());
}

TEST(AudioFileHeader, NamesTheSpeakersWhereTheFormatDoes)
{
    const Bytes surround = build(kWAVE, 3, 0, 16, false, kAudioBus5_1);
    EXPECT_EQ(loadLE<std::uint16_t>(surround.data() + 20), 0xFFFE);
    EXPECT_EQ(loadLE<std::uint16_t>(surround.data() + 22), 6);
    EXPECT_EQ(loadLE<std::uint32_t>(surround.data() + 40), 0x3FU);
    EXPECT_EQ(loadLE<std::uint16_t>(build(kWAVE, 3, 1, 24).data() + 20), 0xFFFE);
}

TEST(AudioFileHeader, BuildsNothingThatCannotBe)
{
    EXPECT_TRUE(build(fourCC("REX2"), 1, 1, 16).empty());
    EXPECT_TRUE(build(kWAVE, -1, 1, 16).empty());
    EXPECT_TRUE(build(kWAVE, 1, 0, 16).empty()); // no bus format either
    EXPECT_TRUE(build(kWAVE, 1, -1, 16).empty());
    EXPECT_TRUE(build(kWAVE, 1, 40000, 16).empty()); // frames of more than 65535 bytes
    EXPECT_TRUE(build(kAIFF, 1, 40000, 16).empty());
    for (const int bits : {0, 12, 20, -16, -64, 128})
        EXPECT_TRUE(build(kWAVE, 1, 1, bits).empty()) << bits;
    EXPECT_TRUE(build(kWAVE, 1, 1, 16, false, kAudioBusUndefined, 0).empty());
    EXPECT_TRUE(build(kWAVE, 1, 1, 16, false, kAudioBusUndefined, 1LL << 32).empty());
    EXPECT_TRUE(build(kWAVE, 0xFFFFFFFF, 1, 8).empty());
    EXPECT_TRUE(build(kAIFF, 0x7FFFFFFF, 1, 8, true).empty());
    EXPECT_TRUE(build(kCAF, INT64_MAX, 2, 8).empty());
    EXPECT_FALSE(build(kCAF, 1LL << 40, 2, 32).empty());
}

} // namespace
