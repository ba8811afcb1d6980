// The chunks manager on real AIFF and CAF files: set, save, read, remove, and from one kind of file to the other.
#include "LoopFiles.h"
#include "loops/VireoLoopUserDataUtils.h"

namespace {

/// Chunks of others, the same in every file.
const Chunks others{{fourCC("cue "), "other"}, {fourCC("uuid"), std::string(40, 'u')}, {fourCC("uuid"), "short"}};

/// A file that has all kinds of loop chunks, `times` over and ahead of the samples if so wished, the first ones first.
Bytes taggedFile(const TemporaryFolder& folder, FourCC container, bool isAhead, const std::vector<std::size_t>& lengths)
{
    Chunks tagged;
    for (const std::size_t length : lengths) {
        const std::string path = folder.write("tagged", audioFile(container));
        EXPECT_TRUE(manage(path).writeChunks(everyKind(length)));
        const Chunks chunks = walkContainer(readFile(path));
        tagged.insert(tagged.end(), chunks.begin() + 2, chunks.end());
    }
    return isAhead ? audioFile(container, tagged) : audioFile(container, {}, tagged);
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
        const Bytes original = isAhead ? audioFile(container, others) : audioFile(container, {}, others);
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

TEST_P(LoopManager, OneKindAloneLeavesTheOthers)
{
    const VireoLoopChunkList list = everyKind(30);
    for (std::size_t i = 0; i < list.size(); ++i) {
        const std::string path = folder.write("file", audioFile(container));
        ASSERT_TRUE(manage(path).writeChunks(everyKind(9)));
        const auto one = std::span(list).subspan(i, 1);
        Tags expected = tagsOf(path);
        ASSERT_TRUE(manage(path).writeChunks(one));
        VireoLoopChunkList alone;
        alone.push_back(std::move(everyKind(30)[i]));
        for (const auto& [key, text] : keptIn(container, alone))
            expected[key] = text;
        EXPECT_EQ(tagsOf(path), expected) << i;
        ASSERT_TRUE(manage(path).removeChunks(one));
        for (const auto& entry : keptIn(container, alone))
            expected.erase(entry.first);
        EXPECT_EQ(tagsOf(path), expected) << i;
    }
}

// An item that becomes longer and has samples behind it goes behind them: the second one was the first one then.
TEST_P(LoopManager, ASecondItemOfAKindDoesNotTakeThePlaceOfTheOneWritten)
{
    for (const bool isAhead : {false, true}) {
        const std::string path = folder.write("file", taggedFile(folder, container, isAhead, {8, 15}));
        EXPECT_EQ(tagsOf(path), keptIn(container, everyKind(8))) << "the first of two is read";
        EXPECT_TRUE(manage(path).writeChunks(everyKind(40)));
        EXPECT_EQ(tagsOf(path), keptIn(container, everyKind(40)));
        EXPECT_TRUE(manage(path).removeChunks(VireoLoopChunks::Empty()));
        EXPECT_EQ(tagsOf(path), Tags()) << "removing leaves none of them";
        EXPECT_EQ(samplesOf(path), testSamples);
    }
}

TEST(LoopFile, BytesOfEachKindInCAF)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", audioFile(kCAF));
    VireoLoopChunkList list;
    list.push_back(std::make_unique<VireoLoopAdditionalChunk>());
    list.push_back(std::make_unique<VireoLoopSilenceChunk>());
    list.push_back(std::make_unique<VireoLoopMidiFileChunk>());
    for (const auto& chunk : list)
        chunk->chunkData().setChunkData(bytesOf("x"), kCAF);
    ASSERT_TRUE(manage(path).writeChunks(list));
    using namespace std::string_literals;
    const Chunks chunks = walkContainer(readFile(path));
    EXPECT_EQ(Chunks(chunks.begin() + 2, chunks.end()),
              (Chunks{{fourCC("uuid"), "\x04\x07\x20\x18\x17\x07\x20\x16\x05\x08\x19\x81\x06\x10\x19\x80x"s},
                      {fourCC("uuid"), "\xce\xe5\xb7\xca\x83\xe4\x47\x2c\x97\x64\x4c\xe0\xc3\x5c\xf0\x5cx"s},
                      {fourCC("midi"), "x"}}));
}

TEST(LoopFile, OthersAreNeitherReadNorWritten)
{
    const TemporaryFolder folder;
    const Bytes wave = audioFile(fourCC("WAVE"), {}, {{fourCC("basc"), std::string(82, '\1')}});
    const std::string path = folder.write("file.wav", wave);
    EXPECT_EQ(manage(path).audioFileTypeID(), fourCC("WAVE"));
    EXPECT_EQ(tagsOf(path), Tags());
    manage(path).writeChunks(everyKind(9));
    manage(path).removeChunks(everyKind(9));
    EXPECT_EQ(readFile(path), wave);

    VireoLoopChunksManager missing = manage(folder / "missing");
    EXPECT_EQ(missing.audioFileTypeID(), 0u);
    EXPECT_FALSE(missing.writeChunks(everyKind(9)));
    EXPECT_FALSE(missing.removeChunks(everyKind(9)));
    EXPECT_FALSE(std::filesystem::exists(folder / "missing"));
}

TEST(LoopFile, CAFInformationOfOthersStays)
{
    const TemporaryFolder folder;
    const std::string path = folder.write("file", audioFile(kCAF));
    const platform::Dictionary mine{{"artist", "A"}, {"year", "1999"}, {"genre", "\xFF"}};
    ASSERT_EQ(openAudio(path)->setInformation(mine), 0);
    EXPECT_EQ(tagsOf(path), (Tags{{"Artist", "A"}})) << "also next to an entry that is not UTF-8";
    VireoLoopChunkList list;
    list.push_back(std::make_unique<VireoLoopFileInfoChunk>());
    static_cast<VireoLoopFileInfoChunk&>(*list.front())
        .fileInfo()
        .setDataDictionary({{VireoLoopFileInfoChunkDataTitleKey, "T"}});
    ASSERT_TRUE(manage(path).writeChunks(list));
    platform::Dictionary read;
    ASSERT_EQ(openAudio(path, false)->information(read), 0);
    EXPECT_EQ(
        read,
        (platform::Dictionary{
            {"title", "T"}, {"artist", ""}, {"copyright", ""}, {"comments", ""}, {"year", "1999"}, {"genre", "\xFF"}}))
        << "all four are overwritten";
    ASSERT_TRUE(manage(path).removeChunks(list));
    ASSERT_EQ(openAudio(path, false)->information(read), 0);
    EXPECT_EQ(read, (platform::Dictionary{{"year", "1999"}, {"genre", "\xFF"}}));
}

namespace {

/// The tags of `from`, by way of the objects, in a new file of the other kind.
std::string carried(const TemporaryFolder& folder, const std::string& from, FourCC to, const std::string& name)
{
    const VireoLoopChunkList list = VireoLoopChunks::Empty();
    manage(from, false).readChunks(list);
    std::string path = folder.write(name, audioFile(to));
    EXPECT_TRUE(manage(path).writeChunks(list));
    return path;
}

} // namespace

TEST(LoopFile, FromAIFFToCAFAndBack)
{
    const TemporaryFolder folder;
    const std::string first = folder.write("a.aiff", audioFile(kAIFF));
    ASSERT_TRUE(manage(first).writeChunks(everyKind(30)));
    const std::string caf = carried(folder, first, kCAF, "b.caf");
    EXPECT_EQ(tagsOf(caf), tagsOf(first));
    EXPECT_EQ(tagsOf(carried(folder, caf, kAIFF, "c.aiff")), tagsOf(first));
}

TEST(LoopFile, WhatIsLostBetweenAIFFAndCAF)
{
    const TemporaryFolder folder;
    struct Loss {
        const char* what;
        FourCC from;
        platform::Dictionary tags;
        Tags lost; // as they are read from the other file, "-" where nothing is
    };
    const auto key = [](const char* name) { return std::string("VireoLoopCombinedTagsChunkData") + name; };
    const Loss losses[] = {
        {"a root note without a name, and its key type with it",
         kAIFF,
         {{key("MidiRootNote"), 60}, {key("KeyType"), 2}},
         {{"MidiRootNote", "0"}, {"KeyType", "0"}}},
        {"a key type that has no name", kAIFF, {{key("MidiRootNote"), 48}, {key("KeyType"), 7}}, {{"KeyType", "0"}}},
        {"the signature of what is no loop",
         kAIFF,
         {{key("FileType"), 2}, {key("SignatureTop"), 4}, {key("SignatureBottom"), 4}},
         {{"SignatureTop", "0"}, {"SignatureBottom", "0"}}},
        {"a loop without beats", kAIFF, {{key("FileType"), 1}, {key("BeatCount"), 0}}, {{"FileType", "2"}}},
        {"other kinds of file", kAIFF, {{key("FileType"), 9}}, {{"FileType", "2"}}},
        {"a negative number of beats", kAIFF, {{key("BeatCount"), -4}}, {{"BeatCount", "0"}, {"FileType", "2"}}},
        {"what follows a comma", kAIFF, {{key("Genre"), "R,B"}}, {{"Genre", "R"}}},
        {"descriptors with a comma", kAIFF, {{key("Descriptors"), platform::Array{"a,b"}}}, {{"Descriptors", "|a|b"}}},
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

    const std::string caf = folder.write("caf", audioFile(kCAF));
    ASSERT_TRUE(manage(caf).writeChunks(everyKind(9)));
    VireoLoopChunkList late;
    late.push_back(std::make_unique<VireoLoopTransientChunk>());
    static_cast<VireoLoopTransientChunk&>(*late.front()).transients().setTransients({{40000, 0x1'0000'0005}});
    ASSERT_TRUE(manage(caf).writeChunks(late));
    Tags expected = tagsOf(caf);
    EXPECT_EQ(expected["transients"], "40000@4294967301 version 0, 0 %, 0");
    expected["transients"] = "-25536@5 version 0, 0 %, 0"; // 32 bits of a frame, a signed type
    expected.erase("silence");                             // which AIFF has no chunk for
    EXPECT_EQ(tagsOf(carried(folder, caf, kAIFF, "aiff")), expected);
}
