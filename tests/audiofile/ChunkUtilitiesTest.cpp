// Chunks stored for any file, inside it or beside it.
#include "audiofile/ChunkUtilities.h"

#include "audiofile/CAudioFileIO.h"
#include "support/ContainerBuilder.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace fs = std::filesystem;

namespace {

constexpr FourCC kId = fourCC("LGWV");

CFileRef file(const std::string& path)
{
    return CFileRef(path.c_str(), false);
}

CChunkData chunkOf(std::string_view body, FourCC id = kId)
{
    CChunkData chunk;
    chunk.id = id;
    chunk.size = static_cast<std::int64_t>(body.size());
    chunk.data = std::make_unique<char[]>(body.size());
    body.copy(chunk.data.get(), body.size());
    return chunk;
}

/// Shifts bytes up on writing and down on reading: what is read back proves both.
void shift(void* data, long size, unsigned char reading)
{
    for (long i = 0; i < size; ++i)
        static_cast<char*>(data)[i] = static_cast<char>(static_cast<char*>(data)[i] + (reading != 0 ? -1 : 1));
}

std::int32_t add(const std::string& path, std::string_view body, long flags = 0)
{
    return CFileUtilAddData(file(path), chunkOf(body), "ovw", flags, shift);
}

/// The chunk that is read back, or the status as text.
std::string readBack(const std::string& path, const char* extension = "ovw")
{
    CChunkData chunk = chunkOf("before");
    chunk.position = chunk.next = 1;
    const std::int32_t status = CFileUtilReadData(file(path), chunk, extension, shift);
    EXPECT_EQ(chunk.id, kId);
    if (status == kStatusOK)
        return std::string(textOf(chunk.bytes()));
    EXPECT_TRUE(chunk.size == 0 && chunk.data == nullptr && chunk.position == 0);
    return std::to_string(status);
}

std::string bodyIn(const std::string& path, FourCC id = kId)
{
    CAudioFileIO in(file(path), 0);
    const auto body = in.FindChunk(id);
    return body ? std::string(textOf(*body)) : "(none)";
}

Bytes wave()
{
    return ContainerBuilder("RIFF").format().chunk("data", "1234").bytes();
}

} // namespace

TEST(ChunkUtilities, OtherFilesHaveAMetadataSidecarThatIsReadWhole)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("song.mp3", "no container");
    EXPECT_EQ(add(path, "abc"), kStatusOK);
    EXPECT_EQ(bodyIn(folder / "song.ktmd"), "bcd");
    EXPECT_EQ(textOf(readFile(path)), "no container");
    // Kept: returns the whole sidecar instead of the chunk, and removal leaves it alone.
    const std::string whole(textOf(readFile(folder / "song.ktmd")));
    std::string expected = whole;
    shift(expected.data(), static_cast<long>(expected.size()), 1);
    EXPECT_EQ(CFileUtilRemoveData(file(path), chunkOf(""), "ovw"), kStatusOK);
    EXPECT_EQ(readBack(path), expected);
    EXPECT_EQ(textOf(readFile(folder / "song.ktmd")), whole);
}

TEST(ChunkUtilities, AnOpenEndedCAFDoesNotSwallowWhatIsAdded)
{
    const TemporaryFolder folder;
    const std::string path =
        folder.write("a.caf", ContainerBuilder("caff").format().chunk("data", "1234abcd", -1).bytes());
    EXPECT_EQ(add(path, "abc"), kStatusOK);
    EXPECT_EQ(bodyIn(path), "bcd");
    EXPECT_EQ(bodyIn(path, kData), "1234abcd");
}

TEST(ChunkUtilities, ATaggedLoopIsSparedOnRequest)
{
    const TemporaryFolder folder;
    Bytes tags(82); // "basc": version, 2 beats, type 1
    storeBE(tags.data(), std::uint32_t{1});
    storeBE(tags.data() + 4, std::uint32_t{2});
    storeBE(tags.data() + 16, std::uint16_t{1});
    const auto image = [&](bool isLoop) {
        ContainerBuilder builder("FORM", "AIFF");
        builder.format(22050).chunk("SSND", 8 + 2 * 22050);
        return (isLoop ? builder.chunk("basc", tags) : builder).bytes();
    };
    const struct {
        bool isLoop;
        long flags;
        const char* stored;
    } cases[] = {{true, kChunkDataUnlessLoop, "(none)"}, {true, 0, "bcd"}, {false, kChunkDataUnlessLoop, "bcd"}};
    for (const auto& [isLoop, flags, stored] : cases) {
        const std::string path = folder.write("file.aif", image(isLoop));
        EXPECT_EQ(add(path, "abc", flags), kStatusOK);
        EXPECT_EQ(bodyIn(path), stored) << isLoop << flags;
    }
}

TEST(ChunkUtilities, TheFirstSourceWins)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("a.wav", wave());
    ASSERT_EQ(add(path, "in the file"), kStatusOK);
    EXPECT_EQ(readBack(path), "in the file");
    folder.write("a.ovw", ContainerBuilder("RIFF").chunk("LGWV", "cftjef").bytes());
    EXPECT_EQ(readBack(path), "beside");
    folder.write("a.ovw", "no container"); // an add writes there, but a read does not look there
    EXPECT_EQ(readBack(path), "in the file");
    folder.write("a.ktmd", "nfub");
    EXPECT_EQ(readBack(path), "meta");
    folder.write("a.ktmd", ""); // of no bytes: deleted
    EXPECT_EQ(readBack(path), "in the file");
    EXPECT_FALSE(fs::exists(folder / "a.ktmd"));
}

TEST(ChunkUtilities, WhatCannotBeDone)
{
    const TemporaryFolder folder;
    fs::create_directory(folder / "folder");
    fs::create_symlink("nowhere", folder / "link");
    for (const std::string& path : {folder / "missing", folder / "folder", folder / "link", std::string()}) {
        SCOPED_TRACE(path);
        EXPECT_EQ(add(path, "abc"), kStatusFileNotFound);
        EXPECT_EQ(CFileUtilReadData(file(path), *std::make_unique<CChunkData>(), "ovw", shift), kStatusFileNotFound);
        EXPECT_EQ(CFileUtilRemoveData(file(path), chunkOf(""), "ovw"), kStatusOK);
    }
    const std::string path = folder.write("a.mp3", "no container");
    folder.write("a.ktmd", "this is no AIFF file at all");
    EXPECT_EQ(add(path, "abc"), kStatusIOError);
    EXPECT_EQ(textOf(readFile(folder / "a.ktmd")), "this is no AIFF file at all");
    fs::remove(folder / "a.ktmd");
    fs::create_directory(folder / "a.ktmd");
    fs::create_directory(folder / "a.ovw");
    EXPECT_EQ(add(path, "abc"), kStatusParameterError);
    EXPECT_EQ(readBack(path), "-1");
    EXPECT_TRUE(fs::is_directory(folder / "a.ovw"));
    EXPECT_EQ(readBack(path, nullptr), "-1");
}

TEST(ChunkUtilities, TheRawSidecarIsNeitherTheMetadataSidecarNorANeighbour)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("song.mp3", "no container");
    folder.write("song", "a neighbour without extension");
    ASSERT_EQ(add(path, "abc"), kStatusOK);
    for (const char* extension : {"ktmd", static_cast<const char*>(nullptr)}) {
        SCOPED_TRACE(extension != nullptr ? extension : "(null)");
        EXPECT_EQ(CFileUtilAddData(file(path), chunkOf("xyz", fourCC("note")), extension, 0, shift), kStatusOK);
        EXPECT_EQ(CFileUtilRemoveData(file(path), chunkOf(""), extension), kStatusOK);
        EXPECT_EQ(bodyIn(folder / "song.ktmd"), "bcd");
        EXPECT_EQ(bodyIn(folder / "song.ktmd", fourCC("note")), "yz{");
        EXPECT_EQ(textOf(readFile(folder / "song")), "a neighbour without extension");
    }
    CChunkData negative = chunkOf("");
    negative.size = -1;
    EXPECT_EQ(CFileUtilAddData(file(path), negative, "ovw", 0, shift), kStatusParameterError);
}

TEST(ChunkUtilities, AnInterruptedCreationOfTheSidecarIsDoneAnew)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("song.mp3", "no container");
    ASSERT_EQ(add(path, "abc"), kStatusOK);
    const Bytes whole = readFile(folder / "song.ktmd");
    for (std::ptrdiff_t size = 0; size < 20; ++size) {
        folder.write("song.ktmd", Bytes(whole.begin(), whole.begin() + size));
        EXPECT_EQ(add(path, "abc"), kStatusOK) << size;
        EXPECT_EQ(readFile(folder / "song.ktmd"), whole) << size;
        folder.write("song.ktmd", std::string(static_cast<std::size_t>(size + 1), 'x')); // somebody's own
        EXPECT_EQ(add(path, "abc"), kStatusIOError) << size;
        EXPECT_EQ(readFile(folder / "song.ktmd").size(), static_cast<std::size_t>(size + 1));
    }
}

TEST(ChunkUtilities, AFullDiskIsTold)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("a.mp3", "no container");
    folder.write("a.ovw", "old");
    {
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC, 1, 100);
        EXPECT_EQ(add(path, "abc"), kStatusDiskFull);
    }
    EXPECT_EQ(textOf(readFile(path)), "no container");
    EXPECT_FALSE(fs::exists(folder / "a.ktmd")); // no half of one
    {
        folder.write("a.ovw", "old");
        FaultInjector faults;
        faults.fail(Call::pwrite, ENOSPC); // of the raw sidecar, of which only the creation counts
        EXPECT_EQ(add(path, "abc"), kStatusOK);
    }
    EXPECT_EQ(bodyIn(folder / "a.ktmd"), "bcd");
    // Kept: a failed add inside a container is not reported; the file is intact.
    const std::string inside = folder.write("a.wav", wave());
    FaultInjector faults;
    faults.fail(Call::pwrite, ENOSPC, 1, 100);
    EXPECT_EQ(add(inside, "abc"), kStatusOK);
    EXPECT_EQ(textOf(readFile(inside)), textOf(wave()));
}
