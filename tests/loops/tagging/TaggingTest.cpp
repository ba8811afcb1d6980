#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/Chunks.h"
#include "loops/tagging/VireoLoopChunkIDHelper.h"
#include "support/Hex.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <bit>

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

// Swaps as many records as the count in host order, and none beyond.
TEST(TransientsChunk, IsSwappedAsFarAsItCounts)
{
    Bytes original(sizeof(tagging::TransientsChunk) + 3 * sizeof(tagging::TransientRecord));
    for (std::size_t i = 0; i < original.size(); ++i)
        original[i] = static_cast<std::byte>(i + 1);
    store(original.data() + 72, std::int32_t{2}, std::endian::native);
    Bytes bytes = original;
    auto* chunk = reinterpret_cast<tagging::TransientsChunk*>(bytes.data());
    tagging::SwapBasicTransientsChunkToBig(chunk);
    if (std::endian::native == std::endian::little) {
        Bytes expected = original;
        const auto reverse = [&](std::size_t at, std::size_t size, std::size_t times = 1) {
            for (; times > 0; --times, at += size)
                std::reverse(expected.begin() + static_cast<std::ptrdiff_t>(at),
                             expected.begin() + static_cast<std::ptrdiff_t>(at + size));
        };
        reverse(0, 2, 4);
        reverse(8, 4, 17);
        for (const std::size_t record : {76u, 76u + 24}) {
            reverse(record, 2, 2);
            reverse(record + 4, 4, 5);
        }
        EXPECT_EQ(toHex(bytes), toHex(expected));
    }
    SwapBasicTransientsChunkToHost(chunk);
    EXPECT_EQ(toHex(bytes), toHex(original));
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

TEST(CAFPayloads, StringsAreAsManyAsAreCountedAndThere)
{
    const struct {
        const char* payload;
        std::string strings;
    } rows[] = {
        {"00000002 6100 6200 6300 6400", "a=b c=d "},
        {"00000001 6100 6200 6300 6400", "a=b "}, // what is not counted is not there
        {"00000000 6100 6200", ""},
        {"00000002 6100 6200", "a=b "},
        {"00000003 6100 6200 6300", "a=b "}, // a key without a value
        {"00000001 6100 62", "a=b "},        // a value without its end
        {"00000001 6100 00", "a= "},
        {"00000009", ""},
        {"0000", ""},
    };
    for (const auto& [payload, expected] : rows) {
        std::string strings;
        tagging::ForEachCAFInfoString(fromHex(payload), [&](std::string_view key, std::string_view value) {
            strings += std::string(key) + "=" + std::string(value) + " ";
        });
        EXPECT_EQ(strings, expected) << payload;
    }
}

} // namespace
