#include "loops/VireoLoopCombinedTagsChunkData.h"
#include "loops/VireoLoopFileInfoChunkData.h"
#include "loops/VireoLoopTransientChunkData.h"
#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/Chunks.h"
#include "support/Hex.h"

#include <gtest/gtest.h>

namespace {

using Tags = VireoLoopCombinedTagsChunkDataTypes;
using Info = VireoLoopFileInfoChunkDataTypes;
using platform::Array;
using platform::Dictionary;

constexpr FourCC kAIFF = fourCC("AIFF");
constexpr FourCC kCAF = fourCC("caff");

std::int64_t number(const Dictionary& tags, const char* key)
{
    const auto* found = platform::find<std::int64_t>(tags, key);
    return found != nullptr ? *found : -1;
}

Dictionary fromCAF(const tagging::StringPairs& strings)
{
    return Tags::combinedTagsChunkDataDictionaryFromCafChunkData(*CAFInfoStringsData(strings));
}

/// The pairs that a dictionary is written as in CAF.
Tags::SearchInfo toCAF(const Dictionary& tags)
{
    return Tags::extractSearchInfoFromData(*Tags::cafChunkDataFromCombinedTagsChunkDataDictionary(tags));
}

Dictionary someTags()
{
    return {{VireoLoopCombinedTagsChunkDataBeatCountKey, 16},
            {VireoLoopCombinedTagsChunkDataMidiRootNoteKey, 57},
            {VireoLoopCombinedTagsChunkDataKeyType, 1},
            {VireoLoopCombinedTagsChunkDataSignatureTopKey, 4},
            {VireoLoopCombinedTagsChunkDataSignatureBottomKey, 4},
            {VireoLoopCombinedTagsChunkDataFileTypeKey, 1},
            {VireoLoopCombinedTagsChunkDataInstrumentTypeKey, "Drums"},
            {VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, "Kit"},
            {VireoLoopCombinedTagsChunkDataGenreKey, "D\xC3\xBC"
                                                     "b"},
            {VireoLoopCombinedTagsChunkDataDescriptorsKey, Array{"Dry", "Grooving"}}};
}

Bytes categoryChunk(std::uint32_t version, std::size_t countOffset, std::size_t descriptorsOffset, std::uint16_t count,
                    const std::vector<std::string>& descriptors)
{
    Bytes bytes(descriptorsOffset + 50 * descriptors.size());
    storeBE(bytes.data(), version);
    storeBE(bytes.data() + countOffset, count);
    const auto put = [&](std::size_t offset, std::string_view text) {
        std::copy_n(bytesOf(text).begin(), std::min<std::size_t>(text.size(), 50),
                    bytes.begin() + static_cast<std::ptrdiff_t>(offset));
    };
    put(4, "Bass");
    put(54, "Synth");
    for (std::size_t i = 0; i < descriptors.size(); ++i)
        put(descriptorsOffset + 50 * i, descriptors[i]);
    return bytes;
}

const Array* descriptorsOf(const Dictionary& tags)
{
    return platform::find<Array>(tags, VireoLoopCombinedTagsChunkDataDescriptorsKey);
}

TEST(CombinedTags, SurviveAIFFAndCAFBothWaysRound)
{
    for (const FourCC type : {kAIFF, kCAF}) {
        VireoLoopCombinedTagsChunkData from, to;
        EXPECT_TRUE(from.isEmpty());
        from.setDataDictionary(someTags());
        to.setChunkData(*from.chunkDataForAudioFileType(type), type);
        EXPECT_EQ(to.dataDictionary(), someTags()) << fourCCText(type);
        EXPECT_FALSE(from.chunkDataForAudioFileType(fourCC("WAVE")));
    }
}

TEST(CombinedTags, AIFFBytesAreTheTwoChunks)
{
    const Bytes archive = *Tags::aifChunkDataFromCombinedTagsChunkDataDictionary(
        {{VireoLoopCombinedTagsChunkDataBeatCountKey, 8},
         {VireoLoopCombinedTagsChunkDataInstrumentTypeKey, std::string(60, 'x')}});
    EXPECT_EQ(toHex(Tags::basicTaggingDataFromCombinedAidChunkData(archive)), "00000001"
                                                                              "00000008" +
                                                                                  std::string(148, '0'));
    const Bytes categories = Tags::categoryDataFromCombinedAidChunkData(archive);
    ASSERT_EQ(categories.size(), sizeof(tagging::CategoryChunk));
    EXPECT_EQ(textOf(BytesView(categories).subspan(4, 50)), std::string(49, 'x') + '\0');
    EXPECT_FALSE(Tags::combinedTagsChunkDataDictionaryFromAifChunkData({}));
}

TEST(CombinedTags, CategoriesAreBoundedByTheirBytes)
{
    const Bytes basic(sizeof(tagging::BasicTaggingChunk));
    const auto read = [&](const Bytes& categories) {
        return *Tags::combinedTagsChunkDataDictionaryFromAifChunkData(
            *Tags::combinedAifChunkDataFrom(basic, categories));
    };
    Bytes whole = categoryChunk(1, 220, 222, 0xFFFF, {"b", "a", "b", "bad\xFF"});
    EXPECT_EQ(*descriptorsOf(read(whole)), (Array{"a", "b"}));
    whole.resize(221);
    const Dictionary cut = read(whole);
    EXPECT_EQ(number(cut, VireoLoopCombinedTagsChunkDataBeatCountKey), 0);
    EXPECT_EQ(cut.count(VireoLoopCombinedTagsChunkDataInstrumentTypeKey), 0u);

    const Dictionary second = read(categoryChunk(2, 322, 324, 3, {"x", "y", "z"}));
    EXPECT_EQ(*platform::find<std::string>(second, VireoLoopCombinedTagsChunkDataInstrumentTypeKey), "Bass");
    EXPECT_EQ(*descriptorsOf(second), (Array{"x", "y", "z"}));
    EXPECT_EQ(read(categoryChunk(3, 220, 222, 1, {"x"})).size(), 6u);
    EXPECT_EQ(descriptorsOf(read(categoryChunk(1, 220, 222, 0, {"x"}))), nullptr);
}

TEST(CombinedTags, VocabularyOfCAF)
{
    const std::pair<const char*, int> notes[] = {{"F#", 54}, {"Bb", 58}, {"H", 0}, {"C", 48}, {"A", 57}, {"", 0}};
    for (const auto& [text, note] : notes)
        EXPECT_EQ(number(fromCAF({{"key signature", text}}), VireoLoopCombinedTagsChunkDataMidiRootNoteKey), note)
            << text;
    const auto keyFor = [](int note, int type) {
        return toCAF(
            {{VireoLoopCombinedTagsChunkDataMidiRootNoteKey, note}, {VireoLoopCombinedTagsChunkDataKeyType, type}});
    };
    EXPECT_EQ(keyFor(49, 1)["key signature"].front(), "Db");
    EXPECT_EQ(keyFor(51, 1)["key signature"].front(), "D#");
    EXPECT_EQ(keyFor(48, 7)["key type"].front(), "any");
    EXPECT_TRUE(keyFor(60, 2).empty());

    const Dictionary loop = fromCAF({{"time signature", "12/8"}, {"beat count", "24"}});
    EXPECT_EQ(number(loop, VireoLoopCombinedTagsChunkDataFileTypeKey), 1);
    EXPECT_EQ(number(loop, VireoLoopCombinedTagsChunkDataSignatureTopKey), 12);
    const Dictionary beatsOnly = fromCAF({{"beat count", "99999999999"}});
    EXPECT_EQ(number(beatsOnly, VireoLoopCombinedTagsChunkDataFileTypeKey), 2);
    EXPECT_EQ(number(beatsOnly, VireoLoopCombinedTagsChunkDataSignatureTopKey), 0);
    EXPECT_EQ(number(beatsOnly, VireoLoopCombinedTagsChunkDataBeatCountKey), INT32_MAX);
    Dictionary noLoop = someTags();
    noLoop[VireoLoopCombinedTagsChunkDataFileTypeKey] = 2;
    EXPECT_EQ(toCAF(noLoop).count("time signature"), 0u);
    EXPECT_EQ(toCAF({{VireoLoopCombinedTagsChunkDataDescriptorsKey, Array{"", "a"}}})["descriptors"],
              (std::vector<std::string>{"", "a"})); // an empty one ahead keeps its comma
}

TEST(CombinedTags, PairsAreReadAsFarAsTheyGo)
{
    const auto read = [](const char* hex) { return Tags::extractSearchInfoFromData(fromHex(hex)); };
    EXPECT_TRUE(read("").empty());
    EXPECT_TRUE(read("0000").empty());
    EXPECT_TRUE(read("00000000"
                     "61006200")
                    .empty());
    EXPECT_EQ(read("ffffffff"
                   "6100622c6300"
                   "64")
                  .size(),
              1u); // a huge count, and a key without its value
    EXPECT_EQ(read("00000001"
                   "610062")
                  .at("a"),
              (std::vector<std::string>{"b"})); // no NUL at the end
    EXPECT_EQ(read("00000002"
                   "61006200"
                   "61006300")
                  .at("a"),
              (std::vector<std::string>{"c"}));
    EXPECT_EQ(read("00000002"
                   "ff006200"
                   "63006400")
                  .size(),
              1u); // not UTF-8
}

TEST(Transients, BothLayoutsAndTheirLimits)
{
    VireoLoopTransientChunkData data;
    EXPECT_TRUE(data.isEmpty());
    EXPECT_EQ(data.aifDataRepresentation()->size(), 76u);
    EXPECT_EQ(data.cafDataRepresentation()->size(), 20u);
    data.setVersion(1);
    data.setTransientDetectionPercentage(50);
    data.setForceDivisionValue(-3);
    data.setTransients({{1, 11025}, {2, 0x1'0000'0005}});

    VireoLoopTransientChunkData aiff, caf;
    aiff.setChunkData(*data.chunkDataForAudioFileType(kAIFF), kAIFF);
    caf.setChunkData(*data.chunkDataForAudioFileType(kCAF), kCAF);
    EXPECT_EQ(caf.transients(), data.transients());
    EXPECT_EQ(aiff.transients(), (std::vector<VireoLoopTransient>{{1, 11025}, {2, 5}})); // 32 bits of a frame
    for (const auto& read : {&aiff, &caf}) {
        EXPECT_EQ(read->version(), 1);
        EXPECT_EQ(read->transientDetectionPercentage(), 50);
        EXPECT_EQ(read->forceDivisionValue(), -3);
    }
    EXPECT_EQ(toHex(*caf.cafDataRepresentation()), "00000000"
                                                   "0001"
                                                   "0000"
                                                   "0032"
                                                   "fffd"
                                                   "0000000000000002"
                                                   "00010000"
                                                   "0000000000002b11"
                                                   "00020000"
                                                   "0000000100000005");
}

TEST(Transients, CountsBeyondTheDataAreCut)
{
    VireoLoopTransientChunkData data;
    data.setTransients({{1, 1}, {1, 2}});
    Bytes aiff = *data.aifDataRepresentation();
    Bytes caf = *data.cafDataRepresentation();
    for (const std::uint32_t count : {0x7FFFFFFFu, 0xFFFFFFFFu}) {
        storeBE(aiff.data() + 72, count);
        storeBE(caf.data() + 12, static_cast<std::int64_t>(static_cast<std::int32_t>(count)) << 32);
        VireoLoopTransientChunkData fromAIFF, fromCAF;
        fromAIFF.readFromAIFData(BytesView(aiff).first(aiff.size() - 1));
        fromCAF.readFromCafData(BytesView(caf).first(caf.size() - 1));
        const std::size_t left = count == 0x7FFFFFFF ? 1 : 0;
        EXPECT_EQ(fromAIFF.transients().size(), left);
        EXPECT_EQ(fromCAF.transients().size(), left);
    }
}

TEST(FileInfo, CommentChunkKeepsItsSpaceAndItsTail)
{
    EXPECT_EQ(toHex(Info::commentDataFromAifCommentChunkStrings(" hi \n")), "0001"
                                                                            "00000000"
                                                                            "0000"
                                                                            "0003"
                                                                            "206869"
                                                                            "0000000000000000");
    EXPECT_EQ(Info::commentStringFromAifCommentChunkData(fromHex("0001000000000000"
                                                                 "0003"
                                                                 "206869")),
              "hi");
    EXPECT_EQ(Info::commentStringFromAifCommentChunkData(fromHex("0001000000000000"
                                                                 "ffff"
                                                                 "206869")),
              "hi");
    EXPECT_FALSE(Info::commentStringFromAifCommentChunkData(fromHex("0000000000000000"
                                                                    "0003"
                                                                    "206869")));
    EXPECT_FALSE(Info::commentStringFromAifCommentChunkData(fromHex("000100")));
    const Bytes longest = Info::commentDataFromAifCommentChunkStrings("a" + std::string(70000, '\xC3'));
    EXPECT_LE(longest.size(), 65535u + 18);
}

TEST(FileInfo, ArchivesAndMerging)
{
    VireoLoopFileInfoChunkData data, read;
    data.setDataDictionary({{VireoLoopFileInfoChunkDataTitleKey, "T"}, {VireoLoopFileInfoChunkDataArtistKey, ""}});
    for (const FourCC type : {kAIFF, kCAF}) {
        read.setChunkData(*data.chunkDataForAudioFileType(type), type);
        EXPECT_EQ(read.dataDictionary(), (Dictionary{{VireoLoopFileInfoChunkDataTitleKey, "T"}}));
    }
    const Bytes archive = *data.aifDataRepresentation();
    EXPECT_EQ(textOf(*Info::aifChunkDataPartFromAifChunkData(archive, VireoLoopFileInfoChunkDataTitleKey)), "T");
    EXPECT_FALSE(Info::aifChunkDataPartFromAifChunkData(archive, VireoLoopFileInfoChunkDataArtistKey));
    EXPECT_EQ(Info::fileInfoTypeForKey(VireoLoopFileInfoChunkDataCopyrightKey), 0x28632920u);
    EXPECT_EQ(Info::fileInfoKeyForKey("other"), "");
    EXPECT_EQ(Info::cafFileInfoPropertyForMergingChunkDataDict(data.dataDictionary(), {{"artist", "A"}, {"year", "1"}}),
              (Dictionary{{"title", "T"}, {"artist", ""}, {"copyright", ""}, {"comments", ""}, {"year", "1"}}));
    read.setChunkData(fromHex("00"), kAIFF); // an archive that is not one
    EXPECT_TRUE(read.isEmpty());
}

} // namespace
