// A disk that fails to read: every chunk operation reports it, and no edit mistakes an unreadable part for the end.
#include "audiofile/CAudioFileIO.h"
#include "audiofile/ChunkUtilities.h"

#include "platform/core/Packed.h"
#include "support/ContainerBuilder.h"
#include "support/FaultInjection.h"
#include "support/QuietLog.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <string>

namespace {

/// Chunks so long that each header takes a separate read.
Bytes image(std::string_view container)
{
    ContainerBuilder builder(container, container == "FORM" ? "AIFF" : "WAVE");
    if (container == "RF64")
        builder.ds64(0, 20000);
    builder.format(10000).chunk("ahea", 5000);
    builder.chunk(container == "FORM" ? "SSND" : "data", std::string(20008, 0),
                  container == "RF64" ? 0xFFFFFFFF : 20008);
    builder.chunk("note", 3000).chunk("LIST", 3000).chunk("note", 3000).chunk("last", 3000);
    Bytes bytes = builder.bytes(container == "RF64" ? std::optional<std::uint32_t>(0xFFFFFFFF) : std::nullopt);
    if (container == "RF64") {
        storeLE(bytes.data() + 20, std::uint64_t{bytes.size() - 8});
        storeLE(bytes.data() + 28, std::uint64_t{20008});
    }
    return bytes;
}

/// All other chunks with a hash of their bodies.
std::string withoutNotes(const Bytes& content)
{
    MemoryAudioFile file(content, 0);
    std::string list;
    file.ForEachChunk([&](const ChunkEntry& chunk) {
        if (chunk.id != fourCC("note") && chunk.id != kDs64 && chunk.id != kJUNK) // RF64 may become RIFF
            list += fourCCText(chunk.id) + std::to_string(chunk.size) + " " +
                    std::to_string(std::hash<std::string_view>()(textOf(file.FindChunk(chunk.id).value_or(Bytes())))) +
                    "\n";
        return true;
    });
    return list;
}

struct Operation {
    const char* name;
    std::int32_t success; // result when it succeeds
    std::function<std::int32_t(CAudioFileIO&)> run;
};

const Operation kOperations[] = {
    {"locate", 1,
     [](CAudioFileIO& file) {
         ChunkEntry chunk;
         return file.LocateChunk(fourCC("last"), chunk);
     }},
    {"locate what is not there", 0,
     [](CAudioFileIO& file) {
         ChunkEntry chunk;
         return file.LocateChunk(fourCC("none"), chunk);
     }},
    {"find", 1,
     [](CAudioFileIO& file) {
         CChunkData chunk;
         return file.FindChunk(fourCC("last"), chunk);
     }},
    {"list", 0, [](CAudioFileIO& file) { return file.ForEachChunk([](const ChunkEntry&) { return true; }); }},
    {"add", 1, [](CAudioFileIO& file) { return file.AddChunk(fourCC("new "), bytesOf("abc"), false); }},
    {"replace", 1, [](CAudioFileIO& file) { return file.AddChunk(fourCC("note"), bytesOf("abc"), true); }},
    {"remove behind", 0, [](CAudioFileIO& file) { return file.RemoveChunk(fourCC("note")); }},
    {"remove ahead", 0, [](CAudioFileIO& file) { return file.RemoveChunk(fourCC("ahea")); }},
    {"remove what is not there", 0, [](CAudioFileIO& file) { return file.RemoveChunk(fourCC("none")); }},
};

TEST(ReadFailure, IsToldByEveryOperationAndCostsNoChunk)
{
    const TemporaryFolder folder;
    const QuietLog quiet;
    for (const char* container : {"RIFF", "RF64", "FORM", "caff"}) {
        const Bytes before = image(container);
        for (const Operation& operation : kOperations) {
            int calls = 0;
            Bytes after;
            for (int failing = 0; failing <= calls; ++failing) { // first a run without a failure
                SCOPED_TRACE(std::string(container) + ", " + operation.name + ", read " + std::to_string(failing));
                const CFileRef ref(folder.write("file", before).c_str(), false);
                CAudioFileIO file;
                std::int32_t result = 0;
                {
                    FaultInjector faults;
                    if (failing > 0)
                        faults.fail(Call::pread, EIO, failing);
                    ASSERT_EQ(file.Open(ref, kFileIOReadWrite), kStatusOK);
                    result = operation.run(file);
                    calls = std::max(calls, faults.calls(Call::pread));
                    file.Close();
                }
                const Bytes now = readFile(folder / "file");
                if (failing == 0) {
                    EXPECT_EQ(result, operation.success);
                    after = now;
                } else if (result == operation.success) {
                    EXPECT_EQ(now, after);
                } else {
                    // Kept: in a CAF file with unreadable headers, no chunk is found.
                    const bool saysNothing = container == std::string_view("caff") &&
                                             operation.name == std::string_view("find") && result == 0;
                    EXPECT_TRUE(result < 0 || saysNothing) << result;
                    // Not rolled back: an interrupted move, and the removal before an addition.
                    if (now.size() != before.size()) {
                        EXPECT_EQ(withoutNotes(now), withoutNotes(before));
                    } else if (result == kStatusOK) {
                        EXPECT_EQ(now, before);
                    }
                }
            }
            EXPECT_GT(calls, 2);
        }
    }
}

TEST(ReadFailure, TheDescriptionSaysThatItIsNotAll)
{
    const TemporaryFolder folder;
    const CFileRef ref(folder.write("a.wav", image("RIFF")).c_str(), false);
    const QuietLog quiet;
    FaultInjector faults;
    CAudioFileIO file;
    faults.fail(Call::pread, EIO, 2); // the header behind "ahea": that of the samples
    ASSERT_EQ(file.Open(ref, kFileIOReadWrite), kStatusOK);
    EXPECT_EQ(file.InfoStatus(), kStatusIOError);
    // A description without samples would let this chunk be cut out from before them.
    EXPECT_EQ(file.RemoveChunk(fourCC("ahea")), kStatusIOError);
    EXPECT_EQ(file.AddChunk(fourCC("new "), bytesOf("x"), false), kStatusIOError);
    EXPECT_EQ(readFile(folder / "a.wav"), image("RIFF"));
    ASSERT_EQ(file.Open(ref, kFileIOReadWrite), kStatusOK);
    EXPECT_EQ(file.InfoStatus(), kStatusOK);
    EXPECT_EQ(file.RemoveChunk(fourCC("ahea")), kStatusOK);
}

} // namespace
