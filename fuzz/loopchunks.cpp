// Each parser of loop chunks on any bytes. What was read is written and read again: once written, tags no longer
// change.
#include "loops/VireoLoopChunks.h"

#include <algorithm>
#include <cstdlib>

namespace {

using Tags = VireoLoopCombinedTagsChunkDataTypes;
using Info = VireoLoopFileInfoChunkDataTypes;

void require(bool condition)
{
    if (!condition)
        std::abort();
}

/// Reads, and writes and reads again until nothing can be cut any more: a field of 50 bytes without a NUL loses its
/// last byte, with it perhaps half a character, and a list of what was skipped is left out.
template <class Data>
void settles(BytesView bytes, FourCC type)
{
    constexpr int kRounds = 4;
    Data data[kRounds];
    data[0].setChunkData(bytes, type);
    for (int round = 1; round < kRounds; ++round) {
        const auto written = data[round - 1].chunkDataForAudioFileType(type);
        require(written.has_value());
        data[round].setChunkData(*written, type);
    }
    if constexpr (std::is_same_v<Data, VireoLoopTransientChunkData>) {
        require(data[0].transients().size() <= bytes.size() / 12);
        require(data[1].transients() == data[0].transients());
        require(data[1].version().value_or(0) == data[0].version().value_or(0));
    } else if constexpr (std::is_same_v<Data, VireoLoopGenericChunkData>) {
        require(std::ranges::equal(*data[kRounds - 1].chunkDataForAudioFileType(type), bytes));
    } else {
        require(data[kRounds - 1].dataDictionary() == data[kRounds - 2].dataDictionary());
    }
}

void readParts(BytesView bytes)
{
    const BytesView half = bytes.first(bytes.size() / 2);
    for (const auto& archive : {Tags::combinedAifChunkDataFrom(bytes, {}), Tags::combinedAifChunkDataFrom({}, bytes),
                                Tags::combinedAifChunkDataFrom(half, bytes.subspan(half.size()))})
        settles<VireoLoopCombinedTagsChunkData>(*archive, fourCC("AIFF"));
    // A text that is written is the text that is read, as long as its chunk has room for it.
    const auto comment = Info::commentStringFromAifCommentChunkData(bytes);
    if (comment && !comment->empty() && comment->size() < 65000)
        require(Info::commentStringFromAifCommentChunkData(Info::commentDataFromAifCommentChunkStrings(*comment)) ==
                comment);
    for (const auto& [key, list] : Tags::extractSearchInfoFromData(bytes))
        require(!list.empty());
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const BytesView bytes = std::as_bytes(std::span(data, size));
    for (const FourCC type : {fourCC("AIFF"), fourCC("caff")}) {
        settles<VireoLoopCombinedTagsChunkData>(bytes, type); // in AIFF an archive
        settles<VireoLoopFileInfoChunkData>(bytes, type);
        settles<VireoLoopTransientChunkData>(bytes, type);
        settles<VireoLoopGenericChunkData>(bytes, type);
    }
    readParts(bytes);
    if (size >= tagging::kUUIDSize)
        cafChunkUUIDToChunkID(reinterpret_cast<const tagging::UUIDBytes*>(data));
    return 0;
}
