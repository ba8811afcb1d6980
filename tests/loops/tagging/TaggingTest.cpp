#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/Chunks.h"
#include "loops/tagging/VireoLoopChunkIDHelper.h"
#include "support/Hex.h"

#include <gtest/gtest.h>

namespace {

TEST(ChunkIDs, EveryUUIDMapsBackAndTheRestMapsToNothing)
{
    using Helper = VireoLoopChunkIDHelper;
    const std::pair<FourCC, const char*> rows[] = {
        {Helper::basicTaggingChunkID(), "29819273b5bf4aefb78d62d1ef90bb2c"},
        {Helper::transientChunkID(), "0352811b9d5d42e1882d6af61a6b330c"},
        {Helper::channelStrip0ChunkID(), "a7bd1b9ddc294b64be7e513f684bdd79"},
        {Helper::channelStrip1ChunkID(), "bcc51a4642804f5faa437dbdadac0979"},
        {Helper::channelStrip2ChunkID(), "52461c716a21436087d87493ae78fac8"},
        {Helper::patchChunkID(), "1fb1573d9daa49b1b997b430b75c6b19"},
        {Helper::genInstChunkID(), "103e1cd9e7dcef4abfc00964320c73d3"},
        {Helper::evSeqChunkID(), "ef014aceb31a453288c020255dc22ecd"},
        {Helper::additionalChunkID(), "04072018170720160508198106101980"},
        {Helper::stepSeqChunkID(), "18b9bfbd15b74e548d37d5f927d82aa5"},
    };
    for (const auto& [id, hex] : rows) {
        const auto* uuid = chunkIDToCafChunkUUID(id);
        ASSERT_NE(uuid, nullptr) << fourCCText(id);
        EXPECT_EQ(toHex(std::as_bytes(std::span(*uuid))), hex);
        EXPECT_EQ(cafChunkUUIDToChunkID(uuid), id);
    }
    for (const FourCC id : {Helper::categoriesChunkID(), Helper::midiFileID(), Helper::silenceChunkID()})
        EXPECT_EQ(chunkIDToCafChunkUUID(id), nullptr);
    EXPECT_EQ(cafChunkUUIDToChunkID(Helper::cafSilenceUUIDChunkID()), 0u);
    EXPECT_EQ(cafChunkUUIDToChunkID(nullptr), 0u);
    EXPECT_EQ(Helper::cafBaseChunkIDForChunkID(fourCC(".mid")), fourCC("midi"));
    EXPECT_EQ(Helper::cafBaseChunkIDForChunkID(fourCC("trns")), fourCC("uuid"));
    EXPECT_TRUE(UUIDIsEqual(nullptr, nullptr));
    EXPECT_FALSE(UUIDIsEqual(tagging::kSilenceUUID, nullptr));
}

// One chunk of each kind, written by hand.
const char* const kBasic = "00000001"
                           "00000010"
                           "0039"
                           "0001"
                           "0004"
                           "0004"
                           "0001"
                           "aabbccdd"
                           "0000000000000000000000000000000000000000000000000000000000"
                           "00000000000000000000000000000000000000000000000000000000000000";

TEST(TaggingChunks, SwapsBringTheFileBytesToHostOrderAndBack)
{
    Bytes bytes = fromHex(kBasic);
    ASSERT_EQ(bytes.size(), sizeof(tagging::BasicTaggingChunk));
    auto* basic = reinterpret_cast<tagging::BasicTaggingChunk*>(bytes.data());
    tagging::SwapBasicTaggingChunkToHost(basic);
    EXPECT_EQ(basic->version, 1u);
    EXPECT_EQ(basic->beatCount, 16);
    EXPECT_EQ(basic->midiRootNote, 57);
    EXPECT_EQ(basic->keyType, 1);
    EXPECT_EQ(basic->fileType, 1);
    EXPECT_EQ(basic->reserved[0], 0xAABBCCDDu);
    tagging::SwapBasicTaggingChunkToBig(basic);
    EXPECT_EQ(bytes, fromHex(kBasic));

    tagging::CategoryChunk category;
    category.reserved[15] = 0x01020304;
    category.reserved2 = 0x0506;
    category.descriptorCount = 0x0708;
    category.genre[0] = 'x';
    tagging::SwapCategoryChunkToBig(&category);
    const BytesView view = std::as_bytes(std::span(&category, 1));
    EXPECT_EQ(toHex(view.subspan(214)), "0102030405060708");
    EXPECT_EQ(toHex(view.subspan(0, 4)), "00000001");
    EXPECT_EQ(toHex(view.subspan(104, 1)), "78");
}

TEST(TaggingChunks, TransientsSwapTheirRecordsWithTheHead)
{
    const std::string head = "0001"
                             "0032"
                             "0003"
                             "0000"
                             "5f000001" +
                             std::string(120, '0') + "00000002";
    const std::string records = "0001"
                                "0000"
                                "00002b11"
                                "00000001000000020000000300000004"
                                "0002"
                                "0000"
                                "fffffffe"
                                "00000000000000000000000000000000";
    Bytes bytes = fromHex(head + records);
    auto* chunk = reinterpret_cast<tagging::TransientsChunk*>(bytes.data());
    SwapBasicTransientsChunkToHost(chunk);
    EXPECT_EQ(chunk->detectionPercentage, 50);
    EXPECT_EQ(chunk->writeTime, 0x5f000001u);
    EXPECT_EQ(chunk->count, 2);
    const auto* record = reinterpret_cast<const tagging::TransientRecord*>(chunk + 1);
    EXPECT_EQ(record[0].frame, 11025u);
    EXPECT_EQ(record[0].reserved2[3], 4u);
    EXPECT_EQ(record[1].frame, 0xFFFFFFFEu);
    tagging::SwapBasicTransientsChunkToBig(chunk);
    EXPECT_EQ(toHex(bytes), head + records);

    // A negative count touches no byte behind the head.
    Bytes negative = fromHex(head.substr(0, 144) + "ffffffff" + "1234");
    SwapBasicTransientsChunkToHost(reinterpret_cast<tagging::TransientsChunk*>(negative.data()));
    EXPECT_EQ(toHex(BytesView(negative).subspan(76)), "1234");
}

TEST(CAFPayloads, GoldenBytes)
{
    EXPECT_EQ(toHex(*CAFInfoStringsData({})), "00000000");
    EXPECT_EQ(toHex(*CAFInfoStringsData({{"title", "a\xC3\xA4"}})), "00000001"
                                                                    "7469746c6500"
                                                                    "61c3a400");
    EXPECT_EQ(toHex(*CAFInfoStringsData({{"k", std::string("a\0b", 3)}})), "00000001"
                                                                           "6b00"
                                                                           "6100");
    EXPECT_EQ(toHex(*CAFBasicUUIDChunkData({{"a", "b"}})), "29819273b5bf4aefb78d62d1ef90bb2c"
                                                           "00000001"
                                                           "61006200");

    const std::string transientsHead = "0352811b9d5d42e1882d6af61a6b330c"
                                       "00000000"
                                       "0001"
                                       "0000"
                                       "0000"
                                       "0000";
    EXPECT_EQ(toHex(*CAFTransientUUIDChunkData(nullptr, 0)), transientsHead + "0000000000000000");
    const std::int64_t positions[] = {0x123456789A, 3};
    EXPECT_EQ(toHex(*CAFTransientUUIDChunkData(positions, 2)), transientsHead + "0000000000000002"
                                                                                "00010000"
                                                                                "000000123456789a"
                                                                                "00010000"
                                                                                "0000000000000003");

    const Bytes data = fromHex("0a0b");
    EXPECT_EQ(toHex(*CAFGenerativeInstrumentsUUIDChunkData(data)), "103e1cd9e7dcef4abfc00964320c73d3"
                                                                   "0a0b");
    EXPECT_EQ(toHex(*CAFStepSequencerUUIDChunkData(data)), "18b9bfbd15b74e548d37d5f927d82aa5"
                                                           "0a0b");
    EXPECT_EQ(toHex(*CAFAdditionalLoopDataUUIDChunkData(data)), "ef014aceb31a453288c020255dc22ecd"
                                                                "0a0b");
}

} // namespace
