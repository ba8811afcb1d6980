// Recognizing containers, walking them and finding chunks, in intact and in damaged files.
#include "audiofile/CAudioFileIO.h"

#include "support/ContainerBuilder.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <chrono>
#include <thread>

using namespace std::string_view_literals;

namespace {

std::string bodyOf(CAudioFileIO& file, const char (&id)[5])
{
    CChunkData chunk;
    const std::int32_t result = file.FindChunk(fourCC(id), chunk);
    return result == 1 ? std::string(textOf(chunk.bytes())) : std::to_string(result);
}

TEST(ChunkWalk, RecognisesContainersByTheirFirstSixteenBytes)
{
    const struct {
        std::string_view start;
        FourCC kind;
    } cases[] = {
        {"RIFF____WAVE____", kWAVE}, {"RF64____WAVE____", kWAVE}, {"BW64____WAVE____", kWAVE},
        {"FORM____AIFF____", kAIFF}, {"FORM____AIFC____", kAIFF}, {"FORM____AIFx____", kAIFF},
        {"CAT ____REX2HEAD", kREX2}, {"CATx____REX2HEAD", kREX2}, {"CAT ____REX2HEAX", 0},
        {"RIFX____WAVE____", 0},     {"RIFF____AVI ____", 0},     {"FORM____8SVX____", 0},
        {"caff____________", 0},     {"RIFF____WAVE___", 0},      {"", 0},
    };
    for (const auto& each : cases) {
        MemoryAudioFile file(bytesOf(each.start), 0);
        EXPECT_EQ(file.IsChunkBased(), each.kind) << each.start;
    }
    EXPECT_EQ(CAudioFileIO().IsChunkBased(), 0u);
}

TEST(ChunkWalk, ToleratesAMissingPadByte)
{
    const auto padded =
        ContainerBuilder("RIFF").format().chunk("odd ", "abc").chunk("next", "1234").chunk("data", "xy");
    const auto bare =
        ContainerBuilder("RIFF").format().unpadded("odd ", "abc").chunk("next", "1234").chunk("data", "xy");
    for (const ContainerBuilder& each : {padded, bare}) {
        MemoryAudioFile file(each.bytes());
        EXPECT_EQ(listing(file), "fmt :16 odd :3 next:4 data:2");
        EXPECT_EQ(bodyOf(file, "next"), "1234");
    }
}

TEST(ChunkWalk, FindsTheLastOfSeveralAndInCAFTheFirstThatIsNotEmpty)
{
    MemoryAudioFile file(
        ContainerBuilder("RIFF").format().chunk("LIST", "first").chunk("data", "xy").chunk("LIST", "last").bytes());
    EXPECT_EQ(bodyOf(file, "LIST"), "last");
    long size = 0;
    long long position = 0;
    long long next = 0;
    EXPECT_EQ(file.FindChunk(fourCC("LIST"), nullptr, &size, &position, &next), 1);
    EXPECT_EQ(size, 4);
    EXPECT_EQ(position, 12 + 24 + 14 + 10);
    EXPECT_EQ(next, position + 12);

    openInMemory(
        file, ContainerBuilder("caff").format().chunk("test", "").chunk("test", "first").chunk("test", "last").bytes());
    EXPECT_EQ(bodyOf(file, "test"), "first");
    EXPECT_EQ(listing(file), "desc:32 test:0 test:5 test:4");
    CChunkData chunk;
    EXPECT_EQ(file.FindChunk(fourCC("test"), chunk), 1);
    EXPECT_EQ(chunk.position, 8 + 12 + 32 + 12);
    EXPECT_EQ(chunk.next, chunk.position + 12 + 5);
}

TEST(ChunkWalk, Find)
{
    CAudioFileIO file;
    char* data = reinterpret_cast<char*>(&file);
    long size = 7;
    long long position = 0;
    EXPECT_EQ(file.FindChunk(kData, &data, &size, &position, nullptr), kStatusParameterError);
    EXPECT_EQ(data, nullptr);
    EXPECT_EQ(size, 0);
    EXPECT_EQ(bodyOf(file, "data"), "-1");
    EXPECT_EQ(file.ForEachChunk({}), -1);
    openInMemory(file, bytesOf("no container at all, but long enough"));
    EXPECT_EQ(bodyOf(file, "data"), "-2");
    EXPECT_EQ(file.ForEachChunk({}), -2);
    openInMemory(file, bytesOf("RIFF\x0C\0\0\0WAVEJUNK\xFF\0\0\0"sv)); // the reservation is not there
    EXPECT_EQ(bodyOf(file, "JUNK"), "-3");
    EXPECT_EQ(file.ForEachChunk({}), -3);
    openInMemory(file, ContainerBuilder("RIFF").format().chunk("none", "").bytes());
    EXPECT_EQ(bodyOf(file, "data"), "0");
    EXPECT_EQ(file.FindChunk(fourCC("none")), Bytes());
    EXPECT_EQ(file.FindChunk(fourCC("data")), std::nullopt);
    CChunkData chunk;
    chunk.data.reset(new char[4]);
    chunk.size = chunk.position = chunk.next = 4;
    EXPECT_EQ(file.FindChunk(kData, chunk), 0);
    EXPECT_TRUE(!chunk.data && chunk.size == 0 && chunk.position == 0 && chunk.next == 0);
}

TEST(ChunkWalk, ClaimsBeyondTheFileCostNothing)
{
    struct Case {
        const char* what;
        Bytes content;
        const char* found; // what searching "data" gives
        const char* listing;
    };
    const Bytes table = ContainerBuilder("RF64")
                            .ds64(0x7FFFFFFFFFFFFFFF, 0x7FFFFFFFFFFFFFFF)
                            .chunk("data", "xy", 0xFFFFFFFF)
                            .bytes(0xFFFFFFFF);
    Bytes longTable = ContainerBuilder("RF64").ds64(66, 2).chunk("data", "xy", 0xFFFFFFFF).bytes(0xFFFFFFFF);
    std::fill_n(longTable.begin() + 44, 4, std::byte{0xFF}); // 2^32 - 1 entries
    const Case cases[] = {
        {"4 GiB in a few bytes", ContainerBuilder("RIFF").format().chunk("data", "xy", 0xFFFFFFFF).bytes(), "-5",
         "fmt :16 data:4294967295"},
        {"negative AIFF size",
         ContainerBuilder("FORM", "AIFF").chunk("data", "xy", 0x80000000).chunk("next", "").bytes(), "-5",
         "data:-2147483648"},
        {"CAF, -1 is to the end", ContainerBuilder("caff").format().chunk("data", "xy", -1).bytes(), "0",
         "desc:32 data:2"},
        {"CAF, -2", ContainerBuilder("caff").format().chunk("data", "xy", -2).chunk("next", "").bytes(), "0",
         "desc:32 data:-2"},
        {"CAF, -1 of another", ContainerBuilder("caff").format().chunk("free", "xy", -1).bytes(), "0",
         "desc:32 free:-1"},
        {"CAF, most", ContainerBuilder("caff").format().chunk("data", "xy", INT64_MAX).bytes(), "-5",
         "desc:32 data:9223372036854775807"},
        {"ds64, most", table, "-5", "ds64:28 data:9223372036854775807"},
        {"ds64 table, most", longTable, "xy", "ds64:28 data:2"},
        {"short ds64", ContainerBuilder("RF64").chunk("ds64", 27).chunk("data", "xy", 0xFFFFFFFF).bytes(), "-5",
         "ds64:27 data:4294967295"},
        {"two data chunks", ContainerBuilder("RIFF").format().chunk("data", "first").chunk("data", "last").bytes(),
         "last", "fmt :16 data:5 data:4"},
        {"zeros behind", ContainerBuilder("RIFF").chunk("data", "xy").chunk("\0\0\0\0"sv, 40).bytes(), "xy",
         "data:2 \\x00\\x00\\x00\\x00:40"},
        {"nothing but zeros behind",
         ContainerBuilder("RIFF").chunk("data", "xy").chunk("\0\0\0\0"sv, Bytes(40), 0).bytes(), "xy", "data:2"},
        {"behind the container", ContainerBuilder("RIFF").chunk("fmt ", "1234").chunk("data", "xy").bytes(16), "0",
         "fmt :4"},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.what);
        MemoryAudioFile file(each.content);
        EXPECT_EQ(bodyOf(file, "data"), each.found);
        EXPECT_EQ(listing(file), each.listing);
    }
}

TEST(ChunkWalk, EveryPrefixOfAFileIsSafe)
{
    const Bytes images[] = {
        ContainerBuilder("RIFF").chunk("JUNK", 30).format().chunk("odd ", "abc").chunk("data", "1234").bytes(),
        ContainerBuilder("RF64")
            .ds64(90, 4, {{fourCC("levl"), 2}})
            .format()
            .chunk("levl", "ab", 0xFFFFFFFF)
            .chunk("data", "1234", 0xFFFFFFFF)
            .bytes(0xFFFFFFFF),
        ContainerBuilder("FORM", "AIFC").format(2).chunk("SSND", 12).chunk("ANNO", "abc").bytes(),
        ContainerBuilder("caff").format().chunk("data", "1234").chunk("info", "abc").bytes(),
    };
    for (const Bytes& image : images) {
        for (std::size_t length = 0; length <= image.size(); ++length) {
            MemoryAudioFile file(BytesView(image).first(length));
            std::int64_t reached = -8;
            ContainerExtent extent;
            const std::int32_t status = file.ForEachChunk(
                [&](const ChunkEntry& chunk) {
                    EXPECT_GT(chunk.offset, reached);
                    reached = chunk.offset;
                    CChunkData found;
                    const std::int32_t result = file.FindChunk(chunk.id, found);
                    EXPECT_TRUE(result == 1 || result == -5 || (chunk.size == 0 && result == 0));
                    return true;
                },
                &extent);
            EXPECT_TRUE(status == 0 || status == -2 || status == -3);
            EXPECT_LE(extent.end, std::int64_t(length));
            EXPECT_LE(reached + 8, std::int64_t(length));
        }
    }
}

TEST(ChunkWalk, StepByStep)
{
    MemoryAudioFile file(
        ContainerBuilder("FORM", "AIFF").chunk("ANNO", "abc").chunk("COMM", 2).chunk("NAME", "x", -8).bytes());
    ContainerChkExtended header;
    ASSERT_EQ(file.ReadExtendedFileHeader(header), 0);
    ChkHeader current, next;
    int error = 1;
    EXPECT_EQ(file.NextChunkHeader(0, nullptr, &current, &error, header), 12);
    EXPECT_TRUE(error == 0 && current.id == fourCC("ANNO") && current.size == 3);
    EXPECT_EQ(file.NextChunkHeader(12, &current, &next, &error, header), 24);
    EXPECT_TRUE(error == 0 && next.id == fourCC("COMM"));
    const long long length = file.GetEOF();
    current = ChkHeader{fourCC("NAME"), static_cast<std::uint32_t>(-8)};
    EXPECT_EQ(file.NextChunkHeader(24, &current, &next, &error, header), length); // negative: the end
    current = ChkHeader{};
    EXPECT_EQ(file.NextChunkHeader(24, &current, &next, &error, header), length);
    EXPECT_TRUE(error == kStatusParameterError && next.id == 0);
    current = ChkHeader{fourCC("NAME"), 1000u};
    EXPECT_EQ(file.NextChunkHeader(34, &current, &next, &error, header), length);
    EXPECT_EQ(error, kStatusEndOfFile);
}

TEST(ChunkWalk, ManyTinyChunksAreReadInBlocks)
{
    constexpr int count = 100000;
    ContainerBuilder builder("RIFF");
    for (int i = 0; i < count; ++i)
        builder.chunk(i == count - 1 ? "last" : "tiny", "");
    const TemporaryFolder folder;
    const CFileRef ref(folder.write("tiny.wav", builder.bytes()).c_str(), false);
    FaultInjector faults;
    CAudioFileIO file(ref, 0);
    int seen = 0;
    const int before = faults.calls(Call::pread);
    EXPECT_EQ(file.ForEachChunk([&](const ChunkEntry&) { return ++seen; }), 0);
    EXPECT_EQ(seen, count);
    EXPECT_LE(faults.calls(Call::pread) - before, count / 50);
    EXPECT_EQ(file.FindChunk(fourCC("last")), Bytes());
    seen = 0;
    EXPECT_EQ(file.ForEachChunk([&](const ChunkEntry&) { return ++seen < 3; }), 0);
    EXPECT_EQ(seen, 3);
}

TEST(ChunkWalk, WhatOthersChangedIsSeen)
{
    const TemporaryFolder folder;
    const std::string path =
        folder.write("a.wav", ContainerBuilder("RIFF").format().chunk("data", "xy").chunk("note", "old").bytes());
    const std::string longBody(2000, 'b'); // more than is kept with its header
    const CFileRef ref(path.c_str(), false);
    CAudioFileIO reader(ref, 0);
    CAudioFileIO writer(ref, kFileIOReadWrite); // keeps nothing between two operations
    reader.SetCache(65536);
    EXPECT_EQ(bodyOf(reader, "note"), "old");
    EXPECT_EQ(bodyOf(writer, "note"), "old");
    folder.write("a.wav", ContainerBuilder("RIFF").format().chunk("note", "new").chunk("data", "xy").bytes());
    EXPECT_EQ(bodyOf(writer, "note"), "new");
    EXPECT_EQ(listing(writer), "fmt :16 note:3 data:2");
    std::this_thread::sleep_for(std::chrono::milliseconds(30)); // the length is the same: only the time tells
    EXPECT_EQ(writer.AddChunk(fourCC("note"), bytesOf("NEW"), true), 1);
    EXPECT_EQ(bodyOf(reader, "note"), "NEW");
    EXPECT_EQ(listing(reader), "fmt :16 free:3 data:2 note:3");
    EXPECT_EQ(writer.AddChunk(fourCC("LIST"), bytesOf(longBody), false), 1);
    EXPECT_EQ(bodyOf(reader, "LIST"), longBody);
    EXPECT_EQ(writer.RemoveChunk(fourCC("note")), 0);
    EXPECT_EQ(bodyOf(reader, "LIST"), longBody); // not the bytes at its old place
    EXPECT_EQ(bodyOf(reader, "note"), "0");
    folder.write("a.wav", "RIFF"); // cut short under a reader
    EXPECT_EQ(bodyOf(reader, "note"), "-2");
}

TEST(ChunkWalk, OpenForWritingCreatesNothing)
{
    const TemporaryFolder folder;
    const CFileRef missing((folder / "missing.wav").c_str(), false);
    CAudioFileIO file;
    EXPECT_EQ(file.Open(missing, kFileIOReadWrite), kStatusFileNotFound);
    EXPECT_EQ(file.Open(CFileRef(folder.path().c_str(), true), kFileIOReadWrite), kStatusFileNotFound);
    EXPECT_EQ(file.Open(missing, kFileIOReadWrite | kFileIOMemory), kStatusOK);
    EXPECT_FALSE(CAudioFileIO(missing, kFileIOReadWrite).IsOpen());
    EXPECT_FALSE(missing.Exists());
}

TEST(ChunkWalk, ByteOrderIsTheFilesUntilTurned)
{
    for (const auto& [content, order] :
         {std::pair{ContainerBuilder("RIFF").format().bytes(), std::endian::little},
          std::pair{ContainerBuilder("FORM", "AIFF").format().bytes(), std::endian::big}}) {
        MemoryAudioFile file(content);
        unsigned int value = 0x01020304;
        int sign = 0x01020304;
        file.ByteOrder(&value);
        file.ByteOrder(&sign);
        EXPECT_EQ(value, inByteOrder(0x01020304u, order));
        EXPECT_EQ(sign, inByteOrder(0x01020304, order));
    }
}

} // namespace
