#include "loops/VireoLoopBaseChunk.h"

#include "loops/GenericChunkAccess.h"
#include "loops/VireoLoopGenericChunkData.h"
#include "loops/tagging/VireoLoopChunkIDHelper.h"

using platform::AudioFile;

VireoLoopBaseChunk::VireoLoopBaseChunk(std::optional<FourCC> aifChunkID, std::optional<FourCC> cafChunkID,
                                       const tagging::UUIDBytes* cafChunkUUID,
                                       std::unique_ptr<VireoLoopChunkData> chunkData)
    : aifChunkID_(aifChunkID.value_or(0)),
      cafChunkID_(cafChunkID ? *cafChunkID : VireoLoopChunkIDHelper::cafBaseChunkIDForChunkID(aifChunkID_)),
      cafChunkUUID_(cafChunkUUID ? cafChunkUUID : VireoLoopChunkIDHelper::cafUUIDChunkIDForChunkID(aifChunkID_)),
      chunkData_(chunkData ? std::move(chunkData) : std::make_unique<VireoLoopGenericChunkData>())
{
}

VireoLoopBaseChunk::~VireoLoopBaseChunk() = default;

std::unique_ptr<ChunkReader> VireoLoopBaseChunk::cafChunkReader(AudioFile& file)
{
    return std::make_unique<GenericCafChunkReader>(file, *this);
}

std::unique_ptr<ChunkReader> VireoLoopBaseChunk::aifChunkReader(AudioFile& file)
{
    return std::make_unique<GenericAifChunkReader>(file, *this);
}

std::unique_ptr<ChunkWriter> VireoLoopBaseChunk::cafChunkWriter(AudioFile& file)
{
    return std::make_unique<GenericCafChunkWriter>(file, *this);
}

std::unique_ptr<ChunkWriter> VireoLoopBaseChunk::aifChunkWriter(AudioFile& file)
{
    return std::make_unique<GenericAifChunkWriter>(file, *this);
}

std::unique_ptr<ChunkRemover> VireoLoopBaseChunk::cafChunkRemover(AudioFile& file)
{
    return std::make_unique<GenericCafChunkRemover>(file, *this);
}

std::unique_ptr<ChunkRemover> VireoLoopBaseChunk::aifChunkRemover(AudioFile& file)
{
    return std::make_unique<GenericAifChunkRemover>(file, *this);
}

std::unique_ptr<ChunkReader> VireoLoopBaseChunk::chunkReader(AudioFile& file, FourCC fileType)
{
    if (fileType == fourCC("caff"))
        return cafChunkReader(file);
    return fileType == fourCC("AIFF") ? aifChunkReader(file) : nullptr;
}

std::unique_ptr<ChunkWriter> VireoLoopBaseChunk::chunkWriter(AudioFile& file, FourCC fileType)
{
    if (fileType == fourCC("caff"))
        return cafChunkWriter(file);
    return fileType == fourCC("AIFF") ? aifChunkWriter(file) : nullptr;
}

std::unique_ptr<ChunkRemover> VireoLoopBaseChunk::chunkRemover(AudioFile& file, FourCC fileType)
{
    if (fileType == fourCC("caff"))
        return cafChunkRemover(file);
    return fileType == fourCC("AIFF") ? aifChunkRemover(file) : nullptr;
}
