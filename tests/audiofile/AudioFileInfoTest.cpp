#include "audiofile/AudioFileInfo.h"

#include "MemoryAudioFile.h"
#include "platform/core/Status.h"
#include "support/ContainerBuilder.h"
#include "support/Media.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <limits>
#include <utility>

namespace {

constexpr std::uint32_t kOpenSize = 0xFFFFFFFF;

Bytes media(const std::string& name)
{
    return readFile(mediaPath(name));
}

/// A WAVE file up to its samples.
ContainerBuilder wave(const Bytes& format = waveFormat(1, 2, 8000, 4, 16))
{
    return ContainerBuilder("RIFF").chunk("fmt ", format);
}

/// Ten frames whose size is in the "ds64".
Bytes wave64(std::string_view id, std::uint64_t riffSize, std::uint64_t dataSize)
{
    return ContainerBuilder(id)
        .ds64(riffSize, dataSize)
        .chunk("fmt ", waveFormat(1, 2, 8000, 4, 16))
        .chunk("data", Bytes(40), kOpenSize)
        .bytes(kOpenSize);
}

TEST(AudioFileInfo, CountsTheFramesThatAreThere)
{
    const Bytes fmt16 = waveFormat(1, 2, 8000, 4, 16), data40(40);
    const ContainerBuilder riff("RIFF");
    const auto behind = [&](ContainerBuilder odd) { return odd.chunk("fmt ", fmt16).chunk("data", data40).bytes(); };
    const struct {
        const char* what;
        Bytes content;
        std::int64_t frames, dataOffset;
    } cases[] = {
        {"truncated data", wave().chunk("data", Bytes(42), 4000).bytes(4036), 10, 44},
        {"never finished, header of no frames", wave().chunk("data", data40, 0).bytes(36), 10, 44},
        {"written to a pipe", wave().chunk("data", data40, kOpenSize).bytes(kOpenSize), 10, 44},
        {"open data in a finished container", wave().chunk("data", data40, kOpenSize).bytes(), 10, 44},
        {"empty, with a chunk behind", wave().chunk("data", "").chunk("LIST", "INFO").bytes(), 0, 44},
        {"data ahead of its format", ContainerBuilder(riff).chunk("data", data40).chunk("fmt ", fmt16).bytes(), 10, 20},
        {"no pad byte", behind(ContainerBuilder(riff).unpadded("odd ", "abc")), 10, 55},
        {"pad byte", behind(ContainerBuilder(riff).chunk("odd ", "abc")), 10, 56},
        {"container too short", wave().chunk("data", data40).bytes(20), 10, 44},
        {"BW64", wave64("BW64", 112, 40), 10, 80},
        {"64-bit, never finished", wave64("RF64", 0, 0), 10, 80},
        {"64-bit size negative", wave64("RF64", UINT64_MAX, UINT64_MAX), 10, 80},
        {"64-bit size beyond the file", wave64("RF64", INT64_MAX, INT64_MAX), 10, 80},
    };
    for (const auto& expected : cases) {
        std::int32_t status = -1;
        const AudioFileInfo info = describe(expected.content, &status);
        EXPECT_EQ(status, kStatusOK) << expected.what;
        EXPECT_EQ(info.frames, expected.frames) << expected.what;
        EXPECT_EQ(info.dataOffset, expected.dataOffset) << expected.what;
    }
}

TEST(AudioFileInfo, TakesSampleWidthsAndTagsFromTheWAVEFormat)
{
    const auto withFormat = [](int tag, int channels, int blockAlign, int bits) {
        return describe(wave(waveFormat(tag, channels, 96000, blockAlign, bits)).chunk("data", 48).bytes());
    };
    EXPECT_EQ(withFormat(1, 2, 6, 20).bitsPerSample, 24); // left-aligned in 3 bytes
    EXPECT_EQ(withFormat(1, 2, 8, 24).bitsPerSample, 32); // left-aligned in 4
    EXPECT_EQ(withFormat(1, 2, 0, 16).frames, 12);        // without a frame size, the bits determine it
    EXPECT_EQ(withFormat(7, 2, 2, 8).frames, 24);         // mu-law without a "fact"
    EXPECT_TRUE(withFormat(7, 2, 2, 8).compressed);
    EXPECT_FALSE(withFormat(1, 0, 4, 16).IsLinearPCM());
    EXPECT_FALSE(withFormat(1, 1, 8, 64).IsLinearPCM());
    EXPECT_EQ(withFormat(1, 65535, 0, 65535).frames, 0);
    EXPECT_EQ(withFormat(1, 2, 6, 20).sourceBits, 20);
    EXPECT_EQ(withFormat(7, 2, 2, 8).sourceBits, 0);
    const auto extensible = [](std::uint16_t validBits) {
        Bytes format = waveFormat(0xFFFE, 2, 96000, 8, 32);
        ByteWriter rest(std::endian::little);
        rest.write(std::uint16_t{22});
        rest.write(validBits);
        rest.writeZeros(4);
        rest.write(std::uint16_t{1});
        rest.write(bytesOf(std::string_view("\0\0\0\0\x10\0\x80\0\0\xAA\0\x38\x9B\x71", 14)));
        format.insert(format.end(), rest.view().begin(), rest.view().end());
        return describe(wave(format).chunk("data", 48).bytes());
    };
    EXPECT_EQ(extensible(24).sourceBits, 24); // "24 in 32"
    EXPECT_EQ(extensible(24).bitsPerSample, 32);
    EXPECT_EQ(extensible(0).sourceBits, 32);
    EXPECT_EQ(extensible(33).sourceBits, 32);
}

struct ExtendedFloat {
    std::uint16_t signAndExponent = 0x400E;
    std::uint64_t significand = 0xAC44000000000000; // 44100
};

/// An AIFF file up to its samples, with a compression type if one is given.
ContainerBuilder aiff(std::uint32_t frames, int bits = 16, std::string_view type = "", ExtendedFloat rate = {})
{
    ByteWriter common;
    common.write<std::int16_t>(2);
    common.write(frames);
    common.write(static_cast<std::int16_t>(bits));
    common.write(rate.signAndExponent);
    common.write(rate.significand);
    common.write(bytesOf(type));
    return ContainerBuilder("FORM", type.empty() ? "AIFF" : "AIFC").chunk("COMM", common.view());
}

Bytes withSound(ContainerBuilder aiff, std::size_t bytes, std::uint32_t offset = 0,
                std::optional<std::int64_t> size = {})
{
    ByteWriter body;
    body.write(offset);
    body.writeZeros(4 + bytes);
    return aiff.chunk("SSND", body.view(), size).bytes();
}

TEST(AudioFileInfo, ReadsExtendedFloatsExactly)
{
    const std::pair<ExtendedFloat, double> cases[] = {
        {{0x400E, 0xAC44000000000000}, 44100},      {{0x400B, 0xFA00000000000000}, 8000},
        {{0x400E, 0xBB7FFCCCCCCCCCCD}, 47999.9875}, // 48 kHz, slowed down
        {{0x4010, 0xBB80000000000000}, 192000},     {{0x0000, 0x0000000000000000}, 0},
        {{0x0000, 0x0000000000000001}, 0}, // denormal
        {{0x7FFF, 0x8000000000000000}, 0}, // infinite
        {{0x7FFF, 0xC000000000000001}, 0}, // not a number
        {{0xC00E, 0xAC44000000000000}, 0}, // negative
        {{0x7FFE, 0xFFFFFFFFFFFFFFFF}, 0}, // beyond a double
    };
    for (const auto& [stored, rate] : cases) {
        const AudioFileInfo info = describe(withSound(aiff(4, 16, "", stored), 16));
        EXPECT_DOUBLE_EQ(info.exactSampleRate, rate) << std::hex << stored.signAndExponent;
        EXPECT_EQ(info.sampleRate, std::llround(rate));
        EXPECT_EQ(info.frames, 4);
    }
}

TEST(AudioFileInfo, BoundsAIFFSoundDataByTheFile)
{
    const struct {
        const char* what;
        Bytes content;
        std::int64_t frames;
    } cases[] = {
        {"as it should be", withSound(aiff(4), 16), 4},
        {"a million claimed", withSound(aiff(1000000), 16, 0, 4000008), 4},
        {"fewer counted", withSound(aiff(3), 16), 3},
        {"never filled in", withSound(aiff(0), 16), 4},
        {"written to a pipe", withSound(aiff(0), 16, 0, kOpenSize), 4},
        {"samples begin later", withSound(aiff(4), 16, 4), 3},
        {"an offset beyond the chunk", withSound(aiff(4), 16, 0xFFFFFFF0), 4},
        {"half a head", withSound(aiff(4), 0, 0, 4), 0},
        {"no frames need no sound data", aiff(0).bytes(), 0},
    };
    for (const auto& [what, content, frames] : cases) {
        std::int32_t status = -1;
        EXPECT_EQ(describe(content, &status).frames, frames) << what;
        EXPECT_EQ(status, kStatusOK) << what;
    }
    EXPECT_EQ(describe(withSound(aiff(4), 16, 4)).dataOffset, 58);
    std::int32_t status = -1;
    for (const auto channels : {std::int16_t{0}, std::int16_t{-1}}) {
        Bytes content = withSound(aiff(4), 16);
        storeBE(content.data() + 20, channels);
        const AudioFileInfo info = describe(content);
        EXPECT_EQ(info.channels, 0) << channels;
        EXPECT_EQ(info.frames, 0) << channels;
    }
    describe(aiff(4).bytes(), &status);
    EXPECT_EQ(status, kStatusEndOfFile);
}

/// A CAF file up to its samples.
ContainerBuilder caf(const std::array<std::uint32_t, 5>& numbers, std::string_view format = "lpcm", double rate = 44100)
{
    return ContainerBuilder("caff").chunk("desc", cafDescription(rate, format, numbers));
}

TEST(AudioFileInfo, DescribesCAFData)
{
    const auto with = [](ContainerBuilder caf, std::optional<std::int64_t> size = {}) {
        return describe(caf.chunk("data", Bytes(52), size).bytes());
    };
    const AudioFileInfo info = with(caf({2, 8, 1, 2, 24}));
    EXPECT_EQ(info.bitsPerSample, 32); // left-aligned in 4 bytes
    EXPECT_EQ(info.frames, 6);
    EXPECT_EQ(info.dataOffset, 68);
    EXPECT_EQ(with(caf({0, 0, 0, 2, 24})).frames, 8);
    EXPECT_EQ(with(caf({1, 8, 1, 1, 64})).byteSwapped, std::endian::native == std::endian::little);
    EXPECT_EQ(with(caf({2, 4, 1, 2, 16}), -1).frames, 12);
    EXPECT_EQ(with(caf({2, 4, 1, 2, 16}), INT64_MAX).frames, 12);
    for (const double rate : {std::nan(""), std::numeric_limits<double>::infinity(), -1.0, 1e300, 1e-310})
        EXPECT_EQ(with(caf({2, 4, 1, 2, 16}, "lpcm", rate)).sampleRate, 0) << rate;
    EXPECT_EQ(with(caf({2, kOpenSize, 1, kOpenSize, kOpenSize})).frames, 0);
    EXPECT_EQ(describe(caf({0, 34, 64, 1, 0}, "ima4").chunk("data", 72).bytes()).frames, 128);

    for (const auto& [claimed, frames] : {std::pair{std::int64_t{2900}, 2900}, {INT64_MAX, 3072}}) {
        ByteWriter table; // of three packets, which hold no more than 3072
        table.write(std::int64_t{3});
        table.write(claimed);
        table.writeZeros(8);
        const ContainerBuilder image = caf({0, 0, 1024, 2, 0}, "aac ").chunk("data", 52).chunk("pakt", table.view());
        EXPECT_EQ(describe(image.bytes()).frames, frames);
    }
}

TEST(AudioFileInfo, RecognisesWhatItCannotRead)
{
    std::int32_t status = -1;
    EXPECT_EQ(fourCCText(describe(bytesOf("CAT xxxxREX2HEAD"), &status).fileType), "REX2");
    EXPECT_EQ(status, kStatusOK);
    for (const std::string_view text :
         {"", "R", "RIFFxxxxAVI ", "MThd, and more than 16 bytes", "FORMxxxx8SVXxxxx", "CAT xxxxREX2TAIL"}) {
        EXPECT_EQ(describe(bytesOf(text), &status).fileType, 0U) << text;
        EXPECT_EQ(status, kStatusParameterError) << text;
    }
    for (const std::string_view text : {"RIFFxxxxWAVE", "FORMxxxxAIFCxxxx", "caff1234", "RIFFxxxxWAVEfmt \x10\0\0\0"}) {
        describe(bytesOf(text), &status);
        EXPECT_EQ(status, kStatusEndOfFile) << text;
    }
}

// Every truncation, and every header byte set to 0xFF, 0x7F and 0: no crash, and no frame that does not exist.
TEST(AudioFileInfo, SurvivesDamage)
{
    const auto check = [](BytesView content) {
        const AudioFileInfo info = describe(content);
        EXPECT_GE(info.frames, 0);
        EXPECT_LE(info.dataSize, static_cast<std::int64_t>(content.size()));
        const std::int64_t framesThere =
            info.IsLinearPCM() ? static_cast<std::int64_t>(content.size()) / info.bytesPerFrame : INT64_MAX;
        EXPECT_LE(info.frames, framesThere);
    };
    for (const char* name :
         {"kick-24-rf64.wav", "tone-adpcm.wav", "tone-fl32.aifc", "pluck-24-le.caf", "tone-alac.caf"}) {
        SCOPED_TRACE(name);
        Bytes content = media(name);
        content.resize(std::min<std::size_t>(content.size(), 1000));
        for (std::size_t length = 0; length <= 300; ++length)
            check(BytesView(content).first(length));
        for (std::size_t at = 0; at < 300; ++at)
            for (const int value : {0xFF, 0x7F, 0x00}) {
                const std::byte saved = std::exchange(content[at], static_cast<std::byte>(value));
                check(content);
                content[at] = saved;
            }
    }
}

} // namespace
