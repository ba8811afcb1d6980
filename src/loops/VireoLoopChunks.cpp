#include "loops/VireoLoopChunks.h"

#include "loops/CombinedTaggingChunkAccess.h"
#include "loops/FileInfoChunkAccess.h"

using platform::AudioFile;

VireoLoopFileInfoChunk::VireoLoopFileInfoChunk()
    : VireoLoopBaseChunk(FourCC{0}, FourCC{0}, nullptr, std::make_unique<VireoLoopFileInfoChunkData>())
{
}

std::unique_ptr<ChunkReader> VireoLoopFileInfoChunk::cafChunkReader(AudioFile& file)
{
    return std::make_unique<FileInfoCafChunkReader>(file, *this);
}

std::unique_ptr<ChunkReader> VireoLoopFileInfoChunk::aifChunkReader(AudioFile& file)
{
    return std::make_unique<FileInfoAifChunkReader>(file, *this);
}

std::unique_ptr<ChunkWriter> VireoLoopFileInfoChunk::cafChunkWriter(AudioFile& file)
{
    return std::make_unique<FileInfoCafChunkWriter>(file, *this);
}

std::unique_ptr<ChunkWriter> VireoLoopFileInfoChunk::aifChunkWriter(AudioFile& file)
{
    return std::make_unique<FileInfoAifChunkWriter>(file, *this);
}

std::unique_ptr<ChunkRemover> VireoLoopFileInfoChunk::cafChunkRemover(AudioFile& file)
{
    return std::make_unique<FileInfoCafChunkRemover>(file);
}

std::unique_ptr<ChunkRemover> VireoLoopFileInfoChunk::aifChunkRemover(AudioFile& file)
{
    return std::make_unique<FileInfoAifChunkRemover>(file);
}

VireoLoopCombinedTaggingChunk::VireoLoopCombinedTaggingChunk()
    : VireoLoopBaseChunk(tagging::kBasicTagging, {}, nullptr, std::make_unique<VireoLoopCombinedTagsChunkData>())
{
}

std::unique_ptr<ChunkReader> VireoLoopCombinedTaggingChunk::aifChunkReader(AudioFile& file)
{
    return std::make_unique<CombinedTaggingAifChunkReader>(file, *this);
}

std::unique_ptr<ChunkWriter> VireoLoopCombinedTaggingChunk::aifChunkWriter(AudioFile& file)
{
    return std::make_unique<CombinedTaggingAifChunkWriter>(file, *this);
}

std::unique_ptr<ChunkRemover> VireoLoopCombinedTaggingChunk::aifChunkRemover(AudioFile& file)
{
    return std::make_unique<CombinedTaggingAifChunkRemover>(file);
}

VireoLoopTransientChunk::VireoLoopTransientChunk()
    : VireoLoopBaseChunk(tagging::kTransients, {}, nullptr, std::make_unique<VireoLoopTransientChunkData>())
{
}

namespace {

template <class... Chunks>
VireoLoopChunkList oneOfEach()
{
    VireoLoopChunkList list;
    list.reserve(sizeof...(Chunks));
    (list.push_back(std::make_unique<Chunks>()), ...);
    return list;
}

} // namespace

VireoLoopChunkList VireoLoopChunks::Empty()
{
    return oneOfEach<VireoLoopFileInfoChunk, VireoLoopCombinedTaggingChunk, VireoLoopTransientChunk,
                     VireoLoopChannelStrip0Chunk, VireoLoopChannelStrip1Chunk, VireoLoopChannelStrip2Chunk,
                     VireoLoopPatchChunk, VireoLoopGenInstChunk, VireoLoopEvSeqChunk, VireoLoopAdditionalChunk,
                     VireoLoopStepSeqChunk, VireoLoopMidiFileChunk, VireoLoopSilenceChunk>();
}
