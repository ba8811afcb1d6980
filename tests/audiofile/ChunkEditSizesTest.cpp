// Adding and removing chunks whose sizes need more than 32 bits, or that a container cannot state.
#include "audiofile/CAudioFileIO.h"

#include "support/ContainerBuilder.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace {

constexpr std::int64_t kGiB = 1LL << 30;

std::int32_t add(CAudioFileIO& file, const char (&id)[5], std::string_view body, bool replace = false)
{
    return file.AddChunk(fourCC(id), bytesOf(body), replace);
}

ContainerBuilder wave()
{
    return ContainerBuilder("RIFF").format().chunk("data", "1234");
}

/// A file that is a hole after the given start.
std::string sparseFile(const TemporaryFolder& folder, const Bytes& start, std::int64_t length)
{
    const std::string path = folder.write("sparse.wav", start);
    std::filesystem::resize_file(path, static_cast<std::uintmax_t>(length));
    return path;
}

TEST(ChunkEditSizes, BecomesRF64AndRIFFAgain)
{
    constexpr std::int64_t dataSize = 4 * kGiB - 100;
    const TemporaryFolder folder;
    const Bytes start = ContainerBuilder("RIFF")
                            .chunk("JUNK", std::string(28, '?'))
                            .format()
                            .chunk("data", "", dataSize)
                            .bytes(4 * kGiB - 28);
    const std::string path = sparseFile(folder, start, dataSize + std::int64_t(start.size()));
    {
        CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
        EXPECT_EQ(add(file, "note", "beyond the limit of 32 bits"), 1);
        ContainerChkExtended header;
        ASSERT_EQ(file.ReadExtendedFileHeader(header), 0);
        EXPECT_TRUE(header.id == kRF64 && header.HasValidDs64() && header.size == 0xFFFFFFFF);
        EXPECT_EQ(header.EffectiveSize(), file.GetEOF() - 8);
        EXPECT_EQ(header.dataSize, dataSize); // other readers look only here
        EXPECT_EQ(header.sampleCount, dataSize / 2);
        EXPECT_EQ(header.tableLength, 0u);
    }
    CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
    EXPECT_EQ(file.Info().dataSize, dataSize);
    EXPECT_EQ(textOf(file.FindChunk(fourCC("note")).value_or(Bytes())), "beyond the limit of 32 bits");
    EXPECT_EQ(file.RemoveChunk(fourCC("note")), 0);
    ContainerChkExtended header;
    ASSERT_EQ(file.ReadExtendedFileHeader(header), 0);
    EXPECT_TRUE(header.id == kRIFF && header.HasJunkReservation());
    EXPECT_EQ(header.size, file.GetEOF() - 8);
    EXPECT_EQ(file.GetEOF(), dataSize + std::int64_t(start.size()));
}

TEST(ChunkEditSizes, AFileThatStopsBeing64BitKeepsItsSizes)
{
    // Most writers of RF64 put every size into the "ds64", however small.
    const auto image = [](const char* container) {
        return ContainerBuilder(container)
            .ds64(12 + 60 + 24 + 12 + 12, 4, {{fourCC("levl"), 4}})
            .format()
            .chunk("data", "1234", 0xFFFFFFFF)
            .chunk("levl", "abcd", 0xFFFFFFFF);
    };
    for (const char* container : {"RF64", "BW64"}) {
        MemoryAudioFile file(image(container).chunk("note", "12").bytes(0xFFFFFFFF));
        EXPECT_EQ(add(file, "note", "34", true), 1);
        EXPECT_EQ(listing(file), "JUNK:40 fmt :16 data:4 levl:4 note:2");
        MemoryAudioFile again(contentOf(file));
        EXPECT_EQ(again.Info().containerId, kRIFF);
        EXPECT_EQ(again.Info().frames, 2);
    }
    MemoryAudioFile file(image("RF64").bytes(0xFFFFFFFF));
    EXPECT_EQ(file.RemoveChunk(kData), 0); // samples are not moved: their chunk is neutralised
    EXPECT_EQ(listing(file), "ds64:40 fmt :16 free:4 levl:4");
}

const platform::SystemCalls* realCalls = nullptr;

/// Bodies of gigabytes are not written; the file only gets their length.
std::int64_t writeWithHoles(int descriptor, const void* bytes, std::size_t count, std::int64_t offset)
{
    if (count < kGiB)
        return realCalls->pwrite(descriptor, bytes, count, offset);
    const auto end = offset + static_cast<std::int64_t>(count);
    return realCalls->ftruncate(descriptor, end) == 0 ? static_cast<std::int64_t>(count) : -1;
}

TEST(ChunkEditSizes, AChunkOf4GiBNeedsRoomInTheTable)
{
    const SystemCallGuard guard;
    realCalls = &guard.real();
    platform::systemCalls().pwrite = writeWithHoles;
    const std::unique_ptr<char[]> huge(new char[5 * kGiB]); // not touched
    const TemporaryFolder folder;
    for (const bool hasRoom : {true, false}) {
        ContainerBuilder builder("RF64");
        builder.chunk("ds64", hasRoom ? 40 : 28).format().chunk("data", "1234");
        const CFileRef ref(folder.write("a.wav", builder.bytes()).c_str(), false);
        CAudioFileIO file(ref, kFileIOReadWrite);
        const long long before = file.GetEOF();
        EXPECT_EQ(file.AddChunk(fourCC("levl"), huge.get(), 5 * kGiB, false), hasRoom ? 1 : -9);
        EXPECT_EQ(file.GetEOF(), hasRoom ? before + 8 + 5 * kGiB : before);
        EXPECT_EQ(listing(file), hasRoom ? "ds64:40 fmt :16 data:4 levl:5368709120" : "ds64:28 fmt :16 data:4");
    }
    CAudioFileIO file(CFileRef(folder.write("b.wav", wave().bytes()).c_str(), false), kFileIOReadWrite);
    EXPECT_EQ(file.AddChunk(fourCC("levl"), huge.get(), 5 * kGiB, false), -9); // no reservation
    EXPECT_EQ(readFile(folder.path() / "b.wav"), wave().bytes());
}

TEST(ChunkEditSizes, NoAIFFGrowsPastWhatItsSizeCanSay)
{
    constexpr std::int64_t dataSize = 2 * kGiB - 200;
    const TemporaryFolder folder;
    const Bytes start = ContainerBuilder("FORM", "AIFF").format(2).chunk("SSND", "", dataSize).bytes(2 * kGiB - 158);
    const std::string path = sparseFile(folder, start, dataSize + std::int64_t(start.size()));
    CAudioFileIO file(CFileRef(path.c_str(), false), kFileIOReadWrite);
    const long long before = file.GetEOF();
    EXPECT_EQ(add(file, "note", std::string(200, 'n')), -9);
    EXPECT_EQ(file.GetEOF(), before);
    EXPECT_EQ(add(file, "note", "fits"), 1);
    EXPECT_EQ(textOf(file.FindChunk(fourCC("note")).value_or(Bytes())), "fits");
}

} // namespace
