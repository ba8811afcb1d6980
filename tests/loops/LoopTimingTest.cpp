// Loop facts found while opening a file, and transient positions stored without the object layer.
#include "audiofile/CAudioFileIO.h"
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopTransients.h"
#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/Chunks.h"
#include "support/ContainerBuilder.h"
#include "support/Hex.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace {

constexpr std::uint32_t kFrames = 22050;
constexpr std::size_t kSampleBytes = 2 * kFrames; // half a second of 16-bit mono at 44.1 kHz

Bytes basicTagging(std::int32_t beats, std::int16_t fileType)
{
    tagging::BasicTaggingChunk chunk;
    chunk.beatCount = beats;
    chunk.fileType = fileType;
    tagging::SwapBasicTaggingChunkToBig(&chunk);
    const BytesView bytes = std::as_bytes(std::span(&chunk, 1));
    return {bytes.begin(), bytes.end()};
}

Bytes cafTagging(const tagging::StringPairs& pairs)
{
    return *CAFBasicUUIDChunkData(pairs);
}

AudioFileInfo infoOf(const ContainerBuilder& builder)
{
    MemoryAudioFile file(builder.bytes());
    return file.Info();
}

AudioFileInfo aiffInfo(BytesView tagging)
{
    ContainerBuilder builder("FORM", "AIFF");
    return infoOf(builder.format(kFrames).chunk("SSND", 8 + kSampleBytes).chunk("basc", tagging));
}

AudioFileInfo cafInfo(BytesView tagging)
{
    ContainerBuilder builder("caff");
    builder.format().chunk("data", 4 + kSampleBytes);
    return infoOf(builder.chunk("uuid", std::string(16, 'x') + "other").chunk("uuid", tagging));
}

TEST(LoopTiming, OpeningAFileTellsOfItsLoop)
{
    struct Case {
        const char* what;
        AudioFileInfo info;
        float beats;
        int timing, loops;
        float tempo;
    };
    const Bytes emptyTagging = cafTagging({});
    Bytes truncated = basicTagging(8, 1);
    truncated.pop_back();
    std::string manyDescriptors = "a";
    for (int i = 0; i < 3000; ++i)
        manyDescriptors += ",b";
    const Case cases[] = {
        {"AIFF loop", aiffInfo(basicTagging(2, 1)), 2, 1, 1, 240},
        {"AIFF with a count below 0", aiffInfo(basicTagging(-5, 1)), 0, 1, 1, 0},
        {"AIFF with 81 bytes", aiffInfo(truncated), 0, 0, 0, 0},
        {"CAF loop", cafInfo(cafTagging({{"beat count", "2"}, {"time signature", "4/4"}})), 2, 1, 1, 240},
        {"CAF, the count behind 6 KB of text",
         cafInfo(cafTagging({{"a descriptors", manyDescriptors}, {"beat count", "2"}})), 2, 1, 0, 240},
        {"CAF with a number too large", cafInfo(cafTagging({{"beat count", "99999999999"}})), 2147483648.F, 1, 0,
         257698037760.F},
        {"CAF, a UUID and no more", cafInfo(BytesView(emptyTagging).first(16)), 0, 0, 0, 0},
    };
    for (const Case& expected : cases) {
        SCOPED_TRACE(expected.what);
        EXPECT_EQ(expected.info.frames, std::int64_t{kFrames});
        EXPECT_EQ(expected.info.beatCount, expected.beats);
        EXPECT_EQ(expected.info.timingFlag, expected.timing);
        EXPECT_EQ(expected.info.loopCount, expected.loops);
        EXPECT_FLOAT_EQ(expected.info.loopValue, expected.tempo);
    }
}

class LoopTransients : public testing::Test {
protected:
    /// Opens an AIFF file with these bytes of "trns", if any.
    void open(const std::string& transients)
    {
        ContainerBuilder builder("FORM", "AIFF");
        builder.format(4);
        if (!transients.empty())
            builder.chunk("trns", fromHex(transients));
        image = builder.chunk("SSND", 16).chunk("NAME", "after").bytes();
        ASSERT_EQ(openInMemory(file, image), kStatusOK);
    }
    CAudioFileIO file;
    Bytes image;
    const std::int64_t positions[3] = {0, 0x1'0000'0005, -1};
    // version, percentage, division, reserved, time, 15 reserved words, a count, a record
    const std::string ahead = "0002 0032 0004 0000 5f5e1000" + std::string(15 * 8, 'a');
    const std::string record = "0007 0000 00000010" + std::string(32, '0');
};

TEST_F(LoopTransients, InAIFFKeepWhatStandsAheadOfTheCount)
{
    open(ahead + "00000001" + record);
    ASSERT_TRUE(file.ReplaceVireoLoopTransients(positions, 3));
    const auto expected = [](const char* frame) { return "00010000" + (frame + std::string(32, '0')); };
    EXPECT_EQ(file.FindChunk(fourCC("trns")),
              fromHex(ahead + "00000003" + expected("00000000") + expected("00000005") + expected("ffffffff")));
    ASSERT_TRUE(file.ReplaceVireoLoopTransients(nullptr, 0));
    EXPECT_EQ(file.FindChunk(fourCC("trns")), fromHex(ahead + "00000000"));
    EXPECT_EQ(file.Info().frames, 4);
    EXPECT_EQ(listing(file), "COMM:18 free:100 SSND:16 NAME:5 trns:76");
}

TEST_F(LoopTransients, InAIFFNeedAChunkToReplaceAndPositionsToPutThere)
{
    const struct {
        std::string chunk;
        const std::int64_t* positions;
        std::int64_t count;
    } rows[] = {{"", positions, 1},
                {std::string(2 * 75, '0'), positions, 1},
                {ahead + "00000000", positions, -1},
                {ahead + "00000000", positions, 178'956'968},
                {ahead + "00000000", nullptr, 1}};
    for (const auto& row : rows) {
        open(row.chunk);
        EXPECT_FALSE(file.ReplaceVireoLoopTransients(row.positions, row.count));
        EXPECT_EQ(toHex(contentOf(file)), toHex(image));
    }
}

TEST_F(LoopTransients, InCAFReplaceTheItemOfTheirUUID)
{
    const TemporaryFolder folder;
    const auto fileOf = [&](const ContainerBuilder& builder) {
        return CFileRef(folder.write("file", builder.bytes()).c_str(), false);
    };
    const CFileRef ref = fileOf(ContainerBuilder("caff").format().chunk("data", 12).chunk("info", "abcd"));
    EXPECT_EQ(WriteCAFTransientChunk(ref, positions, 2), kStatusOK);
    EXPECT_EQ(WriteCAFTransientChunk(ref, positions + 1, 1), kStatusOK);
    ASSERT_EQ(file.Open(ref, 0), kStatusOK);
    EXPECT_EQ(file.FindChunk(fourCC("uuid")), CAFTransientUUIDChunkData(positions + 1, 1));
    EXPECT_EQ(WriteCAFTransientChunk(ref, positions, INT64_MAX), kStatusParameterError);
    EXPECT_EQ(WriteCAFTransientChunk(ref, nullptr, 1), kStatusParameterError);
    EXPECT_EQ(WriteCAFTransientChunk(ref, nullptr, 0), kStatusOK); // none
    EXPECT_EQ(WriteCAFTransientChunk(CFileRef((folder / "none").c_str(), false), positions, 1), kStatusFileNotFound);
    const ContainerBuilder aiff = ContainerBuilder("FORM", "AIFF").format(4).chunk("SSND", 16);
    EXPECT_EQ(WriteCAFTransientChunk(fileOf(aiff), positions, 1), kStatusParameterError);
    EXPECT_EQ(readFile(folder / "file"), aiff.bytes());
}

} // namespace

TEST(LoopTiming, ABeatCountIsReadAsItWasWritten)
{
    using Types = VireoLoopCombinedTagsChunkDataTypes;
    const platform::Dictionary tags{{VireoLoopCombinedTagsChunkDataBeatCountKey, std::int64_t{5'000'000'000}}};
    const auto written = Types::cafChunkDataFromCombinedTagsChunkDataDictionary(tags);
    const auto read = Types::combinedTagsChunkDataDictionaryFromCafChunkData(written.value());
    EXPECT_EQ(*platform::find<std::int64_t>(read, VireoLoopCombinedTagsChunkDataBeatCountKey), 5'000'000'000);
}
