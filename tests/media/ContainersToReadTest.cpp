// Containers that are only read: big-endian WAVE, Wave64 and AU, without a decoder module.
#include "ReaderFrames.h"
#include "media/containers/ChannelLayouts.h"
#include "platform/core/ByteWriter.h"
#include "support/FakeDecoder.h"
#include "support/Media.h"
#include "support/URLs.h"

#include <bit>

using namespace platform;

namespace {

constexpr std::uint64_t kToTheEnd = ~std::uint64_t{0};
const std::vector<std::int16_t> kSamples{1, -2, 3, -4, 0x1234, -0x7FFF};

void writeSamples(ByteWriter& out)
{
    for (const std::int16_t sample : kSamples)
        out.write(sample);
}

void writeFormat(ByteWriter& out) // stereo, 8 kHz, 16 bits
{
    out.write(std::uint16_t{1});
    out.write(std::uint16_t{2});
    out.write(std::uint32_t{8000});
    out.write(std::uint32_t{32000});
    out.write(std::uint16_t{4});
    out.write(std::uint16_t{16});
}

Bytes rifx()
{
    ByteWriter out;
    out.write(bytesOf("RIFX"));
    out.write(std::uint32_t{48});
    out.write(bytesOf("WAVEfmt "));
    out.write(std::uint32_t{16});
    writeFormat(out);
    out.write(bytesOf("data"));
    out.write(std::uint32_t{12});
    writeSamples(out);
    return {out.view().begin(), out.view().end()};
}

/// `size` is that of the samples' chunk; if it is unknown, so is the file's.
Bytes wave64(std::uint64_t size = 24 + 12)
{
    constexpr std::string_view rest("\xF3\xAC\xD3\x11\x8C\xD1\0\xC0\x4F\x8E\xDB\x8A", 12);
    ByteWriter out(std::endian::little);
    out.write(bytesOf(std::string_view("riff\x2E\x91\xCF\x11\xA5\xD6\x28\xDB\x04\xC1\0\0", 16)));
    out.write(size == kToTheEnd ? kToTheEnd : std::uint64_t{40 + 40 + 32 + 40});
    const auto chunk = [&](std::string_view id, std::uint64_t extent) {
        out.write(bytesOf(id));
        out.write(bytesOf(rest));
        if (extent > 0)
            out.write(extent);
    };
    chunk("wave", 0);
    chunk("fmt ", 24 + 16);
    writeFormat(out);
    chunk("note", 24 + 3); // ends at a multiple of 8
    out.write(bytesOf("abc"));
    out.writeZeros(5);
    chunk("data", size);
    writeSamples(out);
    return {out.view().begin(), out.view().end()};
}

Bytes au(std::uint64_t size = 12, std::uint32_t offset = 28, std::uint32_t encoding = 3)
{
    ByteWriter out;
    out.write(bytesOf(".snd"));
    for (const std::uint64_t field :
         {std::uint64_t{offset}, size, std::uint64_t{encoding}, std::uint64_t{8000}, std::uint64_t{2}})
        out.write(static_cast<std::uint32_t>(field));
    out.write(bytesOf("note"));
    writeSamples(out);
    return {out.view().begin(), out.view().end()};
}

struct Case {
    const char* name;
    Bytes content;
    FourCC fileType;
    std::size_t frames = 3;
};

std::vector<Case> cases()
{
    return {{"RIFX", rifx(), fourCC("RIFX")},
            {"Wave64", wave64(), fourCC("W64f")},
            {"Wave64, never finished", wave64(kToTheEnd), fourCC("W64f")},
            {"Wave64 of more than there is", wave64(24 + 4000), fourCC("W64f")},
            {"Wave64 of less", wave64(24 + 8), fourCC("W64f"), 2},
            {"AU", au(), fourCC("NeXT")},
            {"AU, never finished", au(kToTheEnd), fourCC("NeXT")},
            {"AU of nothing yet", au(0), fourCC("NeXT")},
            {"AU of more than there is", au(4000), fourCC("NeXT")},
            {"AU of less", au(8), fourCC("NeXT"), 2}};
}

} // namespace

TEST(ContainersToRead, GiveTheirSamplesWithoutAModule)
{
    const FakeDecoder::NoModule none;
    const TemporaryFolder folder;
    for (const Case& test : cases()) {
        SCOPED_TRACE(test.name);
        const std::string path = folder.write("file", test.content);
        std::int32_t status = 0;
        const auto reader = openReader(path, &status);
        ASSERT_TRUE(reader) << status;
        EXPECT_EQ(reader->frameCount(), test.frames);
        EXPECT_EQ(reader->fileFormat().sampleRate, 8000);
        ASSERT_EQ(
            reader->setClientFormat(StreamDescription::packedPCM(8000, 2, {.bits = 16, .order = std::endian::native})),
            0);
        const std::vector<std::int16_t> expected(kSamples.begin(),
                                                 kSamples.begin() + static_cast<std::ptrdiff_t>(test.frames) * 2);
        EXPECT_EQ(readFrom<std::int16_t>(*reader, 0, 10), expected);
        const auto file = AudioFile::openToRead(*urlOf(path), nullptr);
        ASSERT_TRUE(file);
        EXPECT_EQ(file->fileType(), test.fileType);
    }
}

TEST(ContainersToRead, AreNotEdited)
{
    const TemporaryFolder folder;
    for (const Bytes& content : {rifx(), wave64(), au()}) {
        const std::string path = folder.write("file", content);
        for (const auto permission : {AudioFile::Permission::read, AudioFile::Permission::readWrite}) {
            std::int32_t status = 0;
            EXPECT_FALSE(AudioFile::open(*urlOf(path), permission, 0, &status));
            EXPECT_EQ(status, kStatusParameterError);
        }
        std::uint32_t count = 0;
        const auto file = AudioFile::openToRead(*urlOf(path), nullptr);
        ASSERT_TRUE(file);
        EXPECT_EQ(file->setUserData(fourCC("note"), 0, 1, "x"), kStatusWritePermission);
        EXPECT_EQ(file->countUserData(fourCC("note"), count), 0);
        EXPECT_EQ(count, content == wave64() ? 1u : 0u);
        EXPECT_EQ(readFile(path), content);
    }
}

TEST(ContainersToRead, BrokenOnesSaySo)
{
    const FakeDecoder::NoModule none;
    const TemporaryFolder folder;
    const Bytes whole = wave64();
    for (const Bytes& content : {au(12, 8), au(12, 4000), Bytes(whole.begin(), whole.begin() + 90), Bytes(4)}) {
        std::int32_t status = 0;
        EXPECT_FALSE(openReader(folder.write("file", content), &status));
        EXPECT_NE(status, 0);
    }
}

TEST(ChannelLayouts, HaveASpeakerForEachChannelOfTheirTag)
{
    // The low half of a tag is the number of channels.
    constexpr std::uint32_t tags[] = {
        0x640001, 0x650002, 0x6C0004, 0x6D0005, 0x6E0006, 0x6F0008, 0x710003, 0x720003, 0x730004, 0x740004,
        0x750005, 0x760005, 0x770005, 0x780005, 0x790006, 0x7A0006, 0x7B0006, 0x7C0006, 0x7D0007, 0x7E0008,
        0x7F0008, 0x800008, 0x810008, 0x830003, 0x840004, 0x850003, 0x860004, 0x870005, 0x880004, 0x890005,
    };
    for (const std::uint32_t tag : tags)
        EXPECT_EQ(static_cast<std::uint32_t>(std::popcount(speakersOfLayout(tag, 0))), tag & 0xFFFF) << std::hex << tag;
    EXPECT_EQ(speakersOfLayout(0x790006, 0), 0x3Fu); // 5.1
    EXPECT_EQ(speakersOfLayout(0x10000, 0x33), 0x33u);
    EXPECT_EQ(speakersOfLayout(0x6A0002, 0x33), 0u); // binaural
}
