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
}

TEST(CAFPayloads, GoldenBytes)
{
    const std::int64_t positions[] = {0x123456789A, 3};
    const Bytes data = fromHex("0a0b");
    const std::string transients = "0352811b9d5d42e1882d6af61a6b330c 00000000 0001 0000 0000 0000";
    const struct {
        std::optional<Bytes> payload;
        std::string bytes;
    } rows[] = {
        {CAFInfoStringsData({}), "00000000"},
        {CAFInfoStringsData({{"title", "a\xC3\xA4"}}), "00000001 7469746c6500 61c3a400"},
        {CAFInfoStringsData({{"k", std::string("a\0b", 3)}}), "00000001 6b00 6100"},
        {CAFBasicUUIDChunkData({{"a", "b"}}), "29819273b5bf4aefb78d62d1ef90bb2c 00000001 61006200"},
        {CAFTransientUUIDChunkData(nullptr, 0), transients + "0000000000000000"},
        {CAFTransientUUIDChunkData(positions, 2),
         transients + "0000000000000002 00010000 000000123456789a 00010000 0000000000000003"},
        {CAFGenerativeInstrumentsUUIDChunkData(data), "103e1cd9e7dcef4abfc00964320c73d3 0a0b"},
        {CAFStepSequencerUUIDChunkData(data), "18b9bfbd15b74e548d37d5f927d82aa5 0a0b"},
        {CAFAdditionalLoopDataUUIDChunkData(data), "ef014aceb31a453288c020255dc22ecd 0a0b"},
    };
    for (const auto& [payload, bytes] : rows)
        EXPECT_EQ(toHex(payload.value()), hex(bytes));
}

} // namespace
