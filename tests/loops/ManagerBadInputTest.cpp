// Damaged loop files: what is readable is read, the rest is omitted, and memory stays proportional to the file.
#include "LoopFiles.h"
#include "loops/CombinedTaggingChunkAccess.h"
#include "loops/FileInfoChunkAccess.h"
#include "support/FaultInjection.h"

#include <cstdlib>
#include <filesystem>
#include <malloc.h>
#include <new>
#include <random>

using namespace std::string_literals;

namespace {

std::size_t bytesInUse, mostInUse;

void* counted(void* block)
{
    bytesInUse += malloc_usable_size(block);
    mostInUse = std::max(mostInUse, bytesInUse);
    return block;
}

} // namespace

void* operator new(std::size_t size)
{
    if (void* block = std::malloc(size))
        return counted(block);
    throw std::bad_alloc();
}

void operator delete(void* block) noexcept
{
    bytesInUse -= malloc_usable_size(block);
    std::free(block);
}

void operator delete(void* block, std::size_t) noexcept
{
    operator delete(block);
}

namespace {

/// Peak memory while reading the tags.
std::size_t memoryToRead(const std::string& path, Tags& tags)
{
    const VireoLoopChunkList list = VireoLoopChunks::Empty();
    const std::size_t before = mostInUse = bytesInUse;
    manage(path, false).readChunks(list);
    const std::size_t most = mostInUse - before;
    tags = tagsIn(list);
    return most;
}

std::string uuidOf(FourCC id)
{
    return {reinterpret_cast<const char*>(*chunkIDToCafChunkUUID(id)), tagging::kUUIDSize};
}

template <class... Fields>
std::string big(Fields... fields)
{
    ByteWriter writer;
    (writer.write(fields), ...);
    return std::string(textOf(writer.view()));
}

std::string padded(std::string text, std::size_t size)
{
    text.resize(size);
    return text;
}

std::string basic(std::int32_t beats)
{
    return padded(big(std::uint32_t{1}, beats, std::int16_t{57}, std::int16_t{1}), 82);
}

std::string category(std::uint32_t version, const std::string& instrument, std::uint16_t count,
                     const std::string& descriptors)
{
    const std::size_t countOffset = version == 2 ? 322 : 220;
    return padded(big(version) + padded(instrument, 50), countOffset) + big(count) + descriptors;
}

std::string aiffTransients(std::int32_t count, std::size_t there)
{
    std::string body = padded(big(std::int16_t{1}), 72) + big(count);
    for (std::uint32_t i = 0; i < there; ++i)
        body += padded(big(std::int16_t{1}, std::uint16_t{0}, i), 24);
    return body;
}

std::string cafTransients(std::int64_t count, std::size_t there)
{
    std::string body = uuidOf(tagging::kTransients) + padded(big(0, std::uint16_t{1}), 12) + big(count);
    for (std::uint64_t i = 0; i < there; ++i)
        body += big(1 << 16, i);
    return body;
}

Chunks::value_type chunk(const char (&id)[5], const std::string& body)
{
    return {fourCC(id), body};
}

Chunks::value_type pairs(std::uint32_t count, const std::string& texts)
{
    return chunk("uuid", uuidOf(tagging::kBasicTagging) + big(count) + texts);
}

Chunks::value_type info(std::uint32_t count, const std::string& texts)
{
    return chunk("info", big(count) + texts);
}

struct Case {
    const char* what;
    Chunks chunks;
    Tags expected; // the combined tags without their zeros
};

const std::string drums = padded("Drums", 50);
const std::string twoThere = "1@0 1@1 version 1, 0 %, 0";

const Case inAIFF[] = {
    {"more transients than there are",
     {chunk("trns", aiffTransients(10'000'000, 3).substr(0, 76 + 71))},
     {{"transients", twoThere}}},
    {"a negative number of transients", {chunk("trns", aiffTransients(-1, 2))}, {}},
    {"transients cut in their head", {chunk("trns", aiffTransients(1, 1).substr(0, 75))}, {}},
    {"half a category chunk",
     {chunk("basc", basic(8)), chunk("cate", category(1, "Drums", 0, "").substr(0, 221))},
     {{"BeatCount", "8"}, {"MidiRootNote", "57"}, {"KeyType", "1"}}},
    {"version 2",
     {chunk("cate", category(2, "Bass", 1, drums))},
     {{"InstrumentType", "Bass"}, {"Descriptors", "|Drums"}}},
    {"more descriptors than there are",
     {chunk("cate", category(1, std::string(50, 'x'), 0xFFFF, drums + drums.substr(0, 49)))},
     {{"InstrumentType", std::string(50, 'x')}, {"Descriptors", "|Drums"}}},
    {"a descriptor twice, and out of order",
     {chunk("cate", category(1, "", 3, drums + padded("Bass", 50) + drums))},
     {{"Descriptors", "|Bass|Drums"}}},
    {"texts that are not UTF-8",
     {chunk("cate", category(1, "Bass\xFF", 2, padded("\xC3", 50) + drums)), chunk("NAME", "\xFE"),
      chunk("AUTH", "me")},
     {{"Descriptors", "|Drums"}, {"Artist", "me"}}},
    {"a text that was cut within its last character",
     {chunk("cate", category(1, std::string(47, 'x') + "\xF0\x9F\x8E", 0, ""))},
     {{"InstrumentType", std::string(47, 'x')}}},
    {"the shortest text that may have been cut",
     {chunk("cate", category(1, std::string(45, 'x') + "\xFF", 0, ""))},
     {{"InstrumentType", std::string(45, 'x')}}},
    {"a text too short for that", {chunk("cate", category(1, std::string(44, 'x') + "\xFF", 0, ""))}, {}},
    {"more comments than there are",
     {chunk("COMT", big(std::uint16_t{9}, 0, std::uint16_t{0}, std::uint16_t{0xFFFF}) + " hi")},
     {{"Comments", "hi"}}},
};

const Case inCAF[] = {
    {"more transients than there are",
     {chunk("uuid", cafTransients(INT64_MAX, 3).substr(0, 16 + 20 + 35))},
     {{"transients", twoThere}}},
    {"a negative number of transients", {chunk("uuid", cafTransients(INT64_MIN, 1))}, {}},
    {"more pairs than there are", {pairs(0xFFFFFFFF, "genre\0Rock\0"s)}, {{"Genre", "Rock"}}},
    {"a pair without a terminator",
     {pairs(2, "genre\0Rock\0category\0Dru"s)},
     {{"Genre", "Rock"}, {"InstrumentType", "Dru"}}},
    {"pairs that are not UTF-8", {pairs(3, "genre\0\xFF\0\xFF\0x\0category\0Drums\0"s)}, {{"InstrumentType", "Drums"}}},
    {"a key twice", {pairs(2, "genre\0Rock\0genre\0Jazz\0"s)}, {{"Genre", "Jazz"}}},
    {"items too short for a UUID, and two of one",
     {chunk("uuid", uuidOf(tagging::kPatch).substr(0, 15)), chunk("uuid", ""), chunk("uuid", uuidOf(tagging::kPatch)),
      chunk("uuid", uuidOf(tagging::kPatch) + "second")},
     {{"PTCH", ""}}},
    {"information that claims more, and ends in a text",
     {info(0xFFFFFFFF, "title\0T\0title\0U\0\xFF\0x\0artist\0A"s)},
     {{"Title", "T"}}},
};

} // namespace

/// A chunk whose data object has a derived class, so that it is read through an archive.
template <class Chunk, class Data>
struct ReadByArchive : VireoLoopBaseChunk {
    struct Derived : Data {};
    ReadByArchive() : VireoLoopBaseChunk(Chunk().aifChunkID(), {}, nullptr, std::make_unique<Derived>()) {}
    const platform::Dictionary& tags() { return static_cast<Derived&>(chunkData()).dataDictionary(); }
};

/// Reading directly gives the same as the archives that derived classes still need.
void expectWhatArchivesSay(const std::string& path)
{
    VireoLoopFileInfoChunk info;
    VireoLoopCombinedTaggingChunk combined;
    ReadByArchive<VireoLoopFileInfoChunk, VireoLoopFileInfoChunkData> archivedInfo;
    ReadByArchive<VireoLoopCombinedTaggingChunk, VireoLoopCombinedTagsChunkData> archivedTags;
    VireoLoopChunksManager manager = manage(path, false);
    ASSERT_NE(manager.audioFile(), nullptr);
    platform::AudioFile& file = *manager.audioFile();
    if (manager.audioFileTypeID() == kAIFF) {
        FileInfoAifChunkReader(file, info).readChunk();
        FileInfoAifChunkReader(file, archivedInfo).readChunk();
        CombinedTaggingAifChunkReader(file, combined).readChunk();
        CombinedTaggingAifChunkReader(file, archivedTags).readChunk();
    } else {
        FileInfoCafChunkReader(file, info).readChunk();
        FileInfoCafChunkReader(file, archivedInfo).readChunk();
    }
    EXPECT_EQ(info.fileInfo().dataDictionary(), archivedInfo.tags());
    EXPECT_EQ(combined.tags().dataDictionary(), archivedTags.tags());
}

class DamagedLoopFile : public testing::Test {
protected:
    void expectReadable(FourCC container, const Case& each)
    {
        for (const bool isAhead : {false, true}) {
            SCOPED_TRACE(each.what + (container == kAIFF ? " in AIFF"s : " in CAF"s));
            const std::string path = folder.write("file", audioFile(container, each.chunks, isAhead));
            Tags found;
            EXPECT_LT(memoryToRead(path, found), 64u * 1024);
            for (const char* key :
                 {"BeatCount", "MidiRootNote", "KeyType", "SignatureTop", "SignatureBottom", "FileType"})
                if (found.contains(key) && (found[key] == "0" || key == "FileType"s))
                    found.erase(key);
            EXPECT_EQ(found, each.expected);
            expectWhatArchivesSay(path);

            ASSERT_TRUE(manage(path).writeChunks(everyKind(12)));
            EXPECT_EQ(tagsOf(path), keptIn(container, everyKind(12))) << "it can be written over";
            ASSERT_TRUE(manage(path).removeChunks(VireoLoopChunks::Empty()));
            EXPECT_EQ(tagsOf(path), Tags());
            EXPECT_EQ(samplesOf(path), testSamples);
        }
    }
    TemporaryFolder folder;
};

TEST_F(DamagedLoopFile, WhatCanBeReadIsRead)
{
    for (const Case& each : inAIFF)
        expectReadable(kAIFF, each);
    for (const Case& each : inCAF)
        expectReadable(kCAF, each);
}

TEST_F(DamagedLoopFile, SaysWhatItsArchiveSays)
{
    std::mt19937 random(18);
    for (const FourCC container : {kAIFF, kCAF}) {
        const std::string path = folder.write("file", audioFile(container));
        ASSERT_TRUE(manage(path).writeChunks(everyKind(20)));
        const Bytes whole = readFile(path);
        expectWhatArchivesSay(path);
        for (int round = 0; round < 300; ++round) { // the headers of the tags stay mostly whole
            Bytes damaged = whole;
            for (int i = 0; i < 8; ++i)
                damaged[damaged.size() / 8 + random() % (damaged.size() * 7 / 8)] = static_cast<std::byte>(random());
            folder.write("file", damaged);
            if (manage(path, false).audioFile() != nullptr)
                expectWhatArchivesSay(path);
        }
    }
}

namespace {

/// Halves the file before one of the reads.
struct ShrinkingFile {
    static inline int reads, shrinking;
    static inline std::string path;
    static inline platform::SystemCalls real;
    SystemCallGuard guard;

    ShrinkingFile(std::string file, int read)
    {
        path = std::move(file);
        reads = 0;
        shrinking = read;
        real = guard.real();
        platform::systemCalls().pread = [](int descriptor, void* to, std::size_t count, std::int64_t position) {
            if (reads++ == shrinking)
                std::filesystem::resize_file(path, std::filesystem::file_size(path) / 2);
            return real.pread(descriptor, to, count, position);
        };
    }
};

} // namespace

TEST_F(DamagedLoopFile, ShrinkingWhileItIsRead)
{
    for (const FourCC container : {kAIFF, kCAF}) {
        const std::string path = folder.write("file", audioFile(container));
        ASSERT_TRUE(manage(path).writeChunks(everyKind(20)));
        const Bytes whole = readFile(path);
        const Tags all = tagsOf(path);
        for (int read = 0, reads = 1; read < reads; ++read) {
            folder.write("file", whole);
            const VireoLoopChunkList list = VireoLoopChunks::Empty();
            {
                const ShrinkingFile shrinking(path, read);
                manage(path, false).readChunks(list);
                reads = ShrinkingFile::reads;
            }
            // A chunk at the file's end may lose its tail; nothing else changes.
            for (const auto& [key, text] : tagsIn(list))
                EXPECT_TRUE(key == "transients" || all.at(key).starts_with(text))
                    << fourCCText(container) << " at read " << read << ": " << key << "=" << text;
        }
    }
}
