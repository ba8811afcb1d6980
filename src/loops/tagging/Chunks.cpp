#include "loops/tagging/Chunks.h"

#include "platform/core/ByteOrder.h"

namespace tagging {
namespace {

template <class... Fields>
void swapAll(Fields&... fields)
{
    turnFields(std::endian::big, fields...);
}

template <class T, std::size_t N>
void swapEach(std::array<Packed<T>, N>& fields)
{
    for (auto& field : fields)
        swapAll(field);
}

void swapHead(TransientsChunk& chunk)
{
    swapAll(chunk.version, chunk.detectionPercentage, chunk.forceDivision, chunk.reserved, chunk.writeTime,
            chunk.count);
    swapEach(chunk.reserved2);
}

void swapRecords(TransientsChunk* chunk, std::int32_t count)
{
    auto* record = reinterpret_cast<TransientRecord*>(chunk + 1);
    for (std::int32_t i = 0; i < count; ++i, ++record) {
        swapAll(record->type, record->reserved, record->frame);
        swapEach(record->reserved2);
    }
}

} // namespace

void SwapBasicTaggingChunkToBig(BasicTaggingChunk* chunk)
{
    swapAll(chunk->version, chunk->beatCount, chunk->midiRootNote, chunk->keyType, chunk->signatureTop,
            chunk->signatureBottom, chunk->fileType);
    swapEach(chunk->reserved);
}

void SwapBasicTaggingChunkToHost(BasicTaggingChunk* chunk)
{
    SwapBasicTaggingChunkToBig(chunk); // swapping is its own inverse
}

void SwapCategoryChunkToBig(CategoryChunk* chunk)
{
    swapAll(chunk->version, chunk->reserved2, chunk->descriptorCount);
    swapEach(chunk->reserved);
}

void SwapCategoryChunkToHost(CategoryChunk* chunk)
{
    SwapCategoryChunkToBig(chunk);
}

void SwapBasicTransientsChunkToBig(TransientsChunk* chunk)
{
    swapRecords(chunk, chunk->count);
    swapHead(*chunk);
}

} // namespace tagging

void SwapBasicTransientsChunkToHost(tagging::TransientsChunk* chunk)
{
    tagging::swapHead(*chunk);
    tagging::swapRecords(chunk, chunk->count);
}
