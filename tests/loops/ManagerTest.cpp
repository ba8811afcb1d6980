// The chunks manager on real AIFF and CAF files: set, save, read, remove, and convert between the two.
#include "LoopFiles.h"

#include <filesystem>

namespace {

/// Foreign chunks, the same in every file.
const Chunks others{{fourCC("cue "), "other"}, {fourCC("uuid"), std::string(40, 'u')}, {fourCC("uuid"), "short"}};

/// A file with all kinds of loop chunks, each `times` times, before the samples if requested, the first ones first.
Bytes taggedFile(const TemporaryFolder& folder, FourCC container, bool isAhead, const std::vector<std::size_t>& lengths)
{
    Chunks tagged;
    for (const std::size_t length : lengths) {
        const std::string path = folder.write("tagged", audioFile(container));
        EXPECT_TRUE(manage(path).writeChunks(everyKind(length)));
        const Chunks chunks = walkContainer(readFile(path));
        tagged.insert(tagged.end(), chunks.begin() + 2, chunks.end());
    }
    return audioFile(container, tagged, isAhead);
}

} // namespace

class LoopManager : public testing::TestWithParam<FourCC> {
protected:
    const FourCC container = GetParam();
    TemporaryFolder folder;
};

INSTANTIATE_TEST_SUITE_P(Containers, LoopManager, testing::Values(kAIFF, kCAF),
                         [](const auto& each) { return fourCCText(each.param); });

TEST_P(LoopManager, EveryKindIsReadAsItWasSet)
{
    for (const bool isAhead : {false, true}) {
        const Bytes original = audioFile(container, others, isAhead);
        const std::string path = folder.write("file", original);
        for (const std::size_t length : {20u, 20u, 7u, 40u, 39u}) {
            const VireoLoopChunkList list = everyKind(length);
            EXPECT_TRUE(manage(path).writeChunks(list));
            EXPECT_EQ(tagsOf(path), keptIn(container, list)) << length;
            EXPECT_EQ(samplesOf(path), testSamples);
        }
        const std::size_t chunks = walkContainer(readFile(path)).size() - walkContainer(original).size();
        EXPECT_EQ(chunks, container == kAIFF ? 16u : 13u) << "one of each, however often they were written";

        const Bytes before = readFile(path);
        EXPECT_TRUE(manage(path).writeChunks(VireoLoopChunks::Empty()));
        EXPECT_EQ(readFile(path), before) << "empty chunks are skipped";
        EXPECT_TRUE(manage(path).removeChunks(VireoLoopChunks::Empty()));
        EXPECT_EQ(walkContainer(readFile(path)), walkContainer(original)) << "nothing else is removed";
        EXPECT_EQ(tagsOf(path), Tags());
    }
}

TEST(LoopFile, ThatIsNotThereIsNeitherWrittenNorRemovedFrom)
{
    const TemporaryFolder folder;
    EXPECT_FALSE(manage(folder / "none").writeChunks(everyKind(20)));
    EXPECT_FALSE(manage(folder / "none").removeChunks(VireoLoopChunks::Empty()));
    EXPECT_FALSE(std::filesystem::exists(folder / "none"));
}

// An item that grows and precedes samples moves behind them, which would make the second item the first one.
TEST_P(LoopManager, ASecondItemOfAKindNeitherTakesThePlaceOfTheOneWrittenNorGoes)
{
    for (const bool isAhead : {false, true}) {
        const std::string path = folder.write("file", taggedFile(folder, container, isAhead, {8, 15}));
        EXPECT_EQ(tagsOf(path), keptIn(container, everyKind(8))) << "the first of two is read";
        const std::size_t items = walkContainer(readFile(path)).size();
        EXPECT_TRUE(manage(path).writeChunks(everyKind(40)));
        EXPECT_EQ(tagsOf(path), keptIn(container, everyKind(40)));
        EXPECT_EQ(walkContainer(readFile(path)).size(), items);
        EXPECT_TRUE(manage(path).removeChunks(VireoLoopChunks::Empty()));
        EXPECT_EQ(tagsOf(path), Tags()) << "removing leaves none of them";
        EXPECT_EQ(samplesOf(path), testSamples);
    }
}

namespace {

/// The tags of `from`, written through the objects to a new file of the other kind.
std::string carried(const TemporaryFolder& folder, const std::string& from, FourCC to, const std::string& name)
{
    const VireoLoopChunkList list = VireoLoopChunks::Empty();
    manage(from, false).readChunks(list);
    std::string path = folder.write(name, audioFile(to));
    EXPECT_TRUE(manage(path).writeChunks(list));
    return path;
}

} // namespace

TEST(LoopFile, WhatIsLostBetweenAIFFAndCAF)
{
    const TemporaryFolder folder;
    struct Loss {
        const char* what;
        FourCC from;
        platform::Dictionary tags;
        Tags lost; // as read from the other file; "-" if absent
    };
    const auto key = [](const char* name) { return std::string("VireoLoopCombinedTagsChunkData") + name; };
    const Loss losses[] = {
        {"a root note without a name, and its key type with it",
         kAIFF,
         {{key("MidiRootNote"), 60}, {key("KeyType"), 2}},
         {{"MidiRootNote", "0"}, {"KeyType", "0"}}},
        {"a key type that has no name", kAIFF, {{key("MidiRootNote"), 48}, {key("KeyType"), 7}}, {{"KeyType", "0"}}},
        {"a loop without beats", kAIFF, {{key("FileType"), 1}, {key("BeatCount"), 0}}, {{"FileType", "2"}}},
        {"other kinds of file", kAIFF, {{key("FileType"), 9}}, {{"FileType", "2"}}},
        {"a negative number of beats", kAIFF, {{key("BeatCount"), -4}}, {{"BeatCount", "0"}, {"FileType", "2"}}},
        {"what follows a comma", kAIFF, {{key("Genre"), "R,B"}}, {{"Genre", "R"}}},
        {"text from the 50th byte on", kCAF, {{key("Genre"), std::string(60, 'g')}}, {{"Genre", std::string(49, 'g')}}},
        {"an empty text", kCAF, {{key("Genre"), ""}}, {{"Genre", "-"}}},
    };
    for (const Loss& loss : losses) {
        SCOPED_TRACE(loss.what);
        VireoLoopChunkList list;
        auto chunk = std::make_unique<VireoLoopCombinedTaggingChunk>();
        chunk->tags().setDataDictionary(loss.tags);
        list.push_back(std::move(chunk));
        const std::string from = folder.write("from", audioFile(loss.from));
        ASSERT_TRUE(manage(from).writeChunks(list));
        Tags expected = tagsOf(from);
        for (const auto& [name, text] : loss.lost) {
            EXPECT_NE(expected[name], text);
            expected[name] = text;
        }
        std::erase_if(expected, [](const auto& entry) { return entry.second == "-"; });
        if (loss.from == kAIFF && !loss.lost.contains("FileType") && !loss.tags.contains(key("FileType")))
            expected["FileType"] = "2"; // worked out anew, here from no beats
        EXPECT_EQ(tagsOf(carried(folder, from, loss.from == kAIFF ? kCAF : kAIFF, "to")), expected);
    }
}
