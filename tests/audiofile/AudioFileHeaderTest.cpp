#include "audiofile/AudioFileHeader.h"

#include "MemoryAudioFile.h"

#include <gtest/gtest.h>

#include <array>

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

TEST(AudioFileHeader, DescribesItself)
{
    constexpr std::int64_t frames = 77;
    for (const FourCC type : {kWAVE, kAIFF, kCAF})
        for (const int bits : {8, 16, 24, 32, -32, 64})
            for (const int channels : {1, 2, 6, 8})
                for (const bool option : {false, true}) {
                    SCOPED_TRACE(fourCCText(type) + ' ' + std::to_string(bits) + ' ' + std::to_string(channels));
                    // Several formats have eight channels.
                    const TAudioBusFormat bus = channels == 8 && type != kAIFF ? kAudioBus5_1_2 : kAudioBusUndefined;
                    Bytes file = build(type, frames, channels, bits, option, bus, 44056);
                    const std::size_t length = file.size();
                    ASSERT_GT(length, 0U);
                    ASSERT_LE(length, kMaxAudioFileHeaderSize);
                    const int width = std::abs(bits);
                    file.resize(length + static_cast<std::size_t>(frames * channels * width / 8));
                    std::int32_t status = -1;
                    const AudioFileInfo info = describe(file, &status);
                    EXPECT_EQ(status, 0);
                    EXPECT_EQ(info.fileType, type);
                    EXPECT_EQ(info.dataOffset, static_cast<std::int64_t>(length));
                    EXPECT_EQ(info.frames, frames);
                    EXPECT_EQ(info.channels, channels);
                    EXPECT_EQ(info.sampleRate, 44056);
                    EXPECT_EQ(info.bitsPerSample, width);
                    EXPECT_EQ(info.floatingPoint, bits == -32 || bits == 64);
                    EXPECT_EQ(info.sampleFormat.isUnsigned, type == kWAVE && bits == 8);
                    EXPECT_EQ(info.byteSwapped, type == kAIFF && bits != 8);
                    if (bus != kAudioBusUndefined) {
                        EXPECT_EQ(info.busFormat, bus);
                    }
                }
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

TEST(AudioFileHeader, WritesWhatTheFormatsAskFor)
{
    const Bytes plain = build(kWAVE, 3, 1, 8);
    EXPECT_EQ(plain.size(), 44U);
    EXPECT_EQ(loadLE<std::uint32_t>(plain.data() + 4), 36U + 4U); // with the pad byte
    const Bytes floats = build(kWAVE, 3, 2, -32);
    EXPECT_EQ(loadLE<std::uint16_t>(floats.data() + 20), 3);
    EXPECT_EQ(idAt(floats, 38), "fact");
    EXPECT_EQ(loadLE<std::uint32_t>(floats.data() + 46), 3U);
    const Bytes surround = build(kWAVE, 3, 0, 16, false, kAudioBus5_1);
    EXPECT_EQ(loadLE<std::uint16_t>(surround.data() + 20), 0xFFFE);
    EXPECT_EQ(loadLE<std::uint16_t>(surround.data() + 22), 6);
    EXPECT_EQ(loadLE<std::uint32_t>(surround.data() + 40), 0x3FU);
    EXPECT_EQ(loadLE<std::uint16_t>(build(kWAVE, 3, 1, 24).data() + 20), 0xFFFE);
    const Bytes aifc = build(kAIFF, 3, 1, -32);
    EXPECT_EQ(idAt(aifc, 8), "AIFC");
    EXPECT_EQ(idAt(aifc, 12), "FVER");
    EXPECT_EQ(idAt(build(kAIFF, 3, 1, 16), 8), "AIFF");
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
