#include "audiofile/AudioFileInfo.h"

#include "MemoryAudioFile.h"
#include "platform/core/Status.h"
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
    return readFile(std::string(KTFILES_MEDIA "/") + name);
}

Bytes zeros(std::size_t count)
{
    return Bytes(count);
}

TEST(AudioFileInfo, DescribesFilesOfOtherPrograms)
{
    struct Case {
        const char* name;
        const char* container;
        const char* formType;
        const char* format;
        int bits;
        bool isFloat, isBig;
        int channels;
        std::int64_t rate, frames;
    };
    const Case cases[] = {
        {"tone-16.wav", "RIFF", "WAVE", "lpcm", 16, false, false, 1, 44100, 8820},
        {"drum-8.wav", "RIFF", "WAVE", "lpcm", 8, false, false, 1, 22050, 8820},
        {"tone-float.wav", "RIFF", "WAVE", "lpcm", 32, true, false, 1, 44100, 6615},
        {"surround-24.wav", "RIFF", "WAVE", "lpcm", 24, false, false, 3, 48000, 2400},
        {"kick-24-rf64.wav", "RF64", "WAVE", "lpcm", 24, false, false, 2, 48000, 3360},
        {"tone-adpcm.wav", "RIFF", "WAVE", "ms\\x00\\x02", 0, false, false, 1, 44100, 8820},
        {"tone-16.aiff", "FORM", "AIFF", "lpcm", 16, false, true, 2, 44100, 4410},
        {"tone-sowt.aifc", "FORM", "AIFC", "lpcm", 16, false, false, 2, 44100, 4410},
        {"tone-fl32.aifc", "FORM", "AIFC", "lpcm", 32, true, true, 1, 44100, 6615},
        {"bell-16-be.caf", "caff", "", "lpcm", 16, false, true, 1, 44100, 6615},
        {"pluck-24-le.caf", "caff", "", "lpcm", 24, false, false, 2, 44100, 3528},
        {"tone-alac.caf", "caff", "", "alac", 0, false, false, 1, 44100, 8820},
    };
    for (const Case& expected : cases) {
        SCOPED_TRACE(expected.name);
        const Bytes content = media(expected.name);
        std::int32_t status = -1;
        const AudioFileInfo info = describe(content, &status);
        EXPECT_EQ(status, kStatusOK);
        EXPECT_EQ(fourCCText(info.containerId), expected.container);
        EXPECT_EQ(info.formType == 0 ? "" : fourCCText(info.formType), expected.formType);
        EXPECT_EQ(fourCCText(info.formatCode), expected.format);
        EXPECT_EQ(info.bitsPerSample, expected.bits);
        EXPECT_EQ(info.floatingPoint, expected.isFloat);
        EXPECT_EQ(info.byteSwapped, expected.isBig);
        EXPECT_EQ(info.channels, expected.channels);
        EXPECT_EQ(info.sampleRate, expected.rate);
        EXPECT_EQ(info.frames, expected.frames);
        EXPECT_EQ(info.fileLength, static_cast<std::int64_t>(content.size()));
        EXPECT_EQ(info.IsLinearPCM(), expected.bits != 0);
        EXPECT_EQ(info.compressed, expected.bits == 0);
    }
}

Bytes wave(std::uint32_t riffSize, std::initializer_list<Bytes> chunks, std::string_view id = "RIFF")
{
    return joined({chunk(id, riffSize, bytesOf("WAVE")), joined(chunks)});
}

Bytes fmt16()
{
    return chunk("fmt ", 16, waveFormat(1, 2, 8000, 4, 16));
}

// Ten frames of it in a data chunk of any stored size.
Bytes data40(std::uint32_t storedSize)
{
    return chunk("data", storedSize, zeros(40));
}

Bytes wave64(std::string_view id, std::int64_t riffSize, std::int64_t dataSize)
{
    ByteWriter body(std::endian::little);
    body.write(riffSize);
    body.write(dataSize);
    body.writeZeros(12);
    return wave(kOpenSize, {chunk("ds64", 28, body.view()), fmt16(), data40(kOpenSize)}, id);
}

TEST(AudioFileInfo, CountsTheFramesThatAreThere)
{
    const Bytes list = chunk("LIST", 4, bytesOf("INFO"));
    const Bytes oddUnpadded = chunk("odd ", 3, bytesOf("abc"));
    struct Case {
        const char* what;
        Bytes content;
        std::int64_t frames, dataOffset;
    };
    const Case cases[] = {
        {"as it should be", wave(76, {fmt16(), data40(40)}), 10, 44},
        {"truncated data", wave(4036, {fmt16(), chunk("data", 4000, zeros(42))}), 10, 44},
        {"never finished, sizes 0", wave(0, {fmt16(), data40(0)}), 10, 44},
        {"never finished, header of no frames", wave(36, {fmt16(), data40(0)}), 10, 44},
        {"written to a pipe", wave(kOpenSize, {fmt16(), data40(kOpenSize)}), 10, 44},
        {"open data in a finished container", wave(76, {fmt16(), data40(kOpenSize)}), 10, 44},
        {"empty, with a chunk behind", wave(48, {fmt16(), chunk("data", 0, {}), list}), 0, 44},
        {"of two the first", wave(88, {fmt16(), chunk("data", 8, zeros(8)), data40(40)}), 2, 44},
        {"data ahead of its format", wave(76, {data40(40), fmt16()}), 10, 20},
        {"no pad byte", wave(87, {oddUnpadded, fmt16(), data40(40)}), 10, 55},
        {"pad byte", wave(88, {oddUnpadded, zeros(1), fmt16(), data40(40)}), 10, 56},
        {"container too short", wave(20, {fmt16(), data40(40)}), 10, 44},
        {"64-bit sizes", wave64("RF64", 112, 40), 10, 80},
        {"BW64", wave64("BW64", 112, 40), 10, 80},
        {"64-bit, never finished", wave64("RF64", 0, 0), 10, 80},
        {"64-bit size negative", wave64("RF64", -1, -1), 10, 80},
        {"64-bit size beyond the file", wave64("RF64", INT64_MAX, INT64_MAX), 10, 80},
    };
    for (const Case& expected : cases) {
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
        return describe(wave(
            0, {chunk("fmt ", 16, waveFormat(tag, channels, 96000, blockAlign, bits)), chunk("data", 48, zeros(48))}));
    };
    EXPECT_EQ(withFormat(1, 2, 6, 20).bitsPerSample, 24); // left-aligned in 3 bytes
    EXPECT_EQ(withFormat(1, 2, 8, 24).bitsPerSample, 32); // left-aligned in 4
    EXPECT_EQ(withFormat(1, 2, 0, 16).frames, 12);        // no frame size: the bits say it
    EXPECT_TRUE(withFormat(1, 1, 1, 8).sampleFormat.isUnsigned);
    EXPECT_TRUE(withFormat(3, 1, 8, 64).floatingPoint);
    EXPECT_EQ(withFormat(7, 2, 2, 8).frames, 24); // mu-law without a "fact"
    EXPECT_TRUE(withFormat(7, 2, 2, 8).compressed);
    EXPECT_FALSE(withFormat(1, 0, 4, 16).IsLinearPCM());
    EXPECT_FALSE(withFormat(1, 1, 8, 64).IsLinearPCM());
    EXPECT_EQ(withFormat(1, 65535, 0, 65535).frames, 0);
}

Bytes extendedFloat(std::uint16_t signAndExponent, std::uint64_t significand)
{
    ByteWriter out;
    out.write(signAndExponent);
    out.write(significand);
    return out.take();
}

Bytes aiff(std::uint32_t frames, int bits, const Bytes& rate, std::string_view type, const Bytes& soundChunk)
{
    ByteWriter common;
    common.write<std::int16_t>(2);
    common.write(frames);
    common.write(static_cast<std::int16_t>(bits));
    common.write(rate);
    common.write(bytesOf(type));
    const auto size = static_cast<std::uint32_t>(common.size());
    const Bytes body = joined({chunk("COMM", size, common.view(), std::endian::big), soundChunk});
    return joined({chunk("FORM", static_cast<std::uint32_t>(body.size() + 4), bytesOf(type.empty() ? "AIFF" : "AIFC"),
                         std::endian::big),
                   body});
}

Bytes sound(std::uint32_t size, std::uint32_t offset, std::size_t bytes)
{
    ByteWriter body;
    body.write(offset);
    body.write<std::uint32_t>(0);
    body.writeZeros(bytes);
    return chunk("SSND", size, body.view(), std::endian::big);
}

const Bytes k44100 = extendedFloat(0x400E, 0xAC44000000000000);

TEST(AudioFileInfo, ReadsExtendedFloatsExactly)
{
    struct Case {
        std::uint16_t signAndExponent;
        std::uint64_t significand;
        double rate;
    };
    const Case cases[] = {
        {0x400E, 0xAC44000000000000, 44100},      {0x400B, 0xFA00000000000000, 8000},
        {0x400E, 0xBB7FFCCCCCCCCCCD, 47999.9875}, // 48 kHz, slowed down
        {0x4010, 0xBB80000000000000, 192000},     {0x0000, 0x0000000000000000, 0},
        {0x0000, 0x0000000000000001, 0}, // denormal
        {0x7FFF, 0x8000000000000000, 0}, // infinite
        {0x7FFF, 0xC000000000000001, 0}, // not a number
        {0xC00E, 0xAC44000000000000, 0}, // negative
        {0x7FFE, 0xFFFFFFFFFFFFFFFF, 0}, // beyond a double
    };
    for (const Case& expected : cases) {
        const AudioFileInfo info =
            describe(aiff(4, 16, extendedFloat(expected.signAndExponent, expected.significand), "", sound(24, 0, 16)));
        EXPECT_DOUBLE_EQ(info.exactSampleRate, expected.rate) << std::hex << expected.signAndExponent;
        EXPECT_EQ(info.sampleRate, std::llround(expected.rate));
        EXPECT_EQ(info.frames, 4);
    }
}

TEST(AudioFileInfo, KnowsTheCompressionTypesOfAIFC)
{
    struct Case {
        const char* type;
        int bits, expectedBits;
        bool isFloat, isBig;
        std::int64_t frames; // of 48 bytes
    };
    const Case cases[] = {
        {"NONE", 12, 16, false, true, 12}, {"twos", 24, 24, false, true, 8},   {"sowt", 16, 16, false, false, 12},
        {"raw ", 8, 8, false, false, 24},  {"in24", 16, 24, false, true, 8},   {"in32", 0, 32, false, true, 6},
        {"42ni", 24, 24, false, false, 8}, {"23ni", 32, 32, false, false, 6},  {"fl32", 32, 32, true, true, 6},
        {"FL64", 64, 64, true, true, 3},   {"ulaw", 16, 0, false, false, 100}, {"ima4", 16, 0, false, false, 6400},
    };
    for (const Case& expected : cases) {
        const AudioFileInfo info = describe(aiff(100, expected.bits, k44100, expected.type, sound(56, 0, 48)));
        EXPECT_EQ(info.bitsPerSample, expected.expectedBits) << expected.type;
        EXPECT_EQ(info.floatingPoint, expected.isFloat) << expected.type;
        EXPECT_EQ(info.byteSwapped, expected.isBig) << expected.type;
        EXPECT_EQ(info.frames, expected.frames) << expected.type;
        EXPECT_EQ(fourCCText(info.formatCode), expected.expectedBits != 0 ? "lpcm" : expected.type);
    }
}

TEST(AudioFileInfo, BoundsAIFFSoundDataByTheFile)
{
    const auto framesOf = [](std::uint32_t frames, const Bytes& soundChunk) {
        return describe(aiff(frames, 16, k44100, "", soundChunk)).frames;
    };
    EXPECT_EQ(framesOf(4, sound(24, 0, 16)), 4);
    EXPECT_EQ(framesOf(1000000, sound(4000008, 0, 16)), 4);
    EXPECT_EQ(framesOf(3, sound(24, 0, 16)), 3);
    EXPECT_EQ(framesOf(0, sound(24, 0, 16)), 4);          // never filled in
    EXPECT_EQ(framesOf(0, sound(kOpenSize, 0, 16)), 4);   // written to a pipe
    EXPECT_EQ(framesOf(4, sound(24, 4, 16)), 3);          // samples begin later
    EXPECT_EQ(framesOf(4, sound(24, 0xFFFFFFF0, 16)), 4); // an offset beyond the chunk
    EXPECT_EQ(framesOf(4, sound(4, 0, 0)), 0);
    EXPECT_EQ(describe(aiff(4, 16, k44100, "", sound(24, 4, 16))).dataOffset, 58);

    std::int32_t status = -1;
    describe(aiff(0, 16, k44100, "", {}), &status); // no frames need no sound data
    EXPECT_EQ(status, kStatusOK);
    describe(aiff(4, 16, k44100, "", {}), &status);
    EXPECT_EQ(status, kStatusEndOfFile);
}

Bytes cafChunk(std::string_view id, std::int64_t size, BytesView body)
{
    ByteWriter out;
    out.write(bytesOf(id));
    out.write(size);
    out.write(body);
    return out.take();
}

// The numbers: flags, bytes and frames in a packet, channels, bits.
Bytes caf(double rate, std::string_view format, std::array<std::uint32_t, 5> numbers, const Bytes& chunks)
{
    ByteWriter description;
    description.write(rate);
    description.write(bytesOf(format));
    for (const std::uint32_t number : numbers)
        description.write(number);
    ByteWriter out;
    out.write(bytesOf("caff"));
    out.write<std::uint32_t>(0x00010000);
    out.write(cafChunk("desc", 32, description.view()));
    out.write(chunks);
    return out.take();
}

TEST(AudioFileInfo, DescribesCAFData)
{
    const Bytes data = cafChunk("data", 52, zeros(52));
    const AudioFileInfo info = describe(caf(44100, "lpcm", {2, 8, 1, 2, 24}, data));
    EXPECT_EQ(info.bitsPerSample, 32); // left-aligned in 4 bytes
    EXPECT_EQ(info.frames, 6);
    EXPECT_EQ(info.dataOffset, 68);
    EXPECT_EQ(describe(caf(44100, "lpcm", {0, 0, 0, 2, 24}, data)).frames, 8);
    EXPECT_TRUE(describe(caf(44100, "lpcm", {1, 8, 1, 1, 64}, data)).byteSwapped);
    EXPECT_EQ(describe(caf(44100, "lpcm", {2, 4, 1, 2, 16}, cafChunk("data", -1, zeros(52)))).frames, 12);
    EXPECT_EQ(describe(caf(44100, "lpcm", {2, 4, 1, 2, 16}, cafChunk("data", INT64_MAX, zeros(52)))).frames, 12);
    for (const double rate : {std::nan(""), std::numeric_limits<double>::infinity(), -1.0, 1e300, 1e-310})
        EXPECT_EQ(describe(caf(rate, "lpcm", {2, 4, 1, 2, 16}, data)).sampleRate, 0) << rate;
    EXPECT_EQ(describe(caf(44100, "lpcm", {2, kOpenSize, 1, kOpenSize, kOpenSize}, data)).frames, 0);
    EXPECT_EQ(describe(caf(44100, "ima4", {0, 34, 64, 1, 0}, cafChunk("data", 72, zeros(72)))).frames, 128);

    ByteWriter table;
    table.write(std::int64_t{3}); // packets
    table.write(std::int64_t{2900});
    table.writeZeros(8);
    const Bytes packetTable = cafChunk("pakt", 24, table.view());
    EXPECT_EQ(describe(caf(44100, "aac ", {0, 0, 1024, 2, 0}, joined({data, packetTable}))).frames, 2900);
    table.patch(8, INT64_MAX); // more than three packets hold
    EXPECT_EQ(
        describe(caf(44100, "aac ", {0, 0, 1024, 2, 0}, joined({data, cafChunk("pakt", 24, table.view())}))).frames,
        3072);
}

TEST(AudioFileInfo, RecognisesWhatItCannotRead)
{
    std::int32_t status = -1;
    EXPECT_EQ(fourCCText(describe(chunk("CAT ", 100, bytesOf("REX2HEAD"), std::endian::big), &status).fileType),
              "REX2");
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

// Every truncation, and every byte of the headers set to 0xFF, 0x7F and 0: no crash, and no frame that is not there.
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

TEST(AudioFileInfo, TempoIsFiveThousandTimesTheBeatsPerMinute)
{
    AudioFileInfo info;
    info.beatCount = 8;
    info.frames = 4 * 44100;
    EXPECT_EQ(info.VireoLoopTempo(), 120U * 5000);
}

} // namespace
