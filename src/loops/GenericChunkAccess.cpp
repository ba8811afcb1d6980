#include "loops/GenericChunkAccess.h"

#include "loops/VireoLoopBaseChunk.h"
#include "loops/VireoLoopUserDataUtils.h"

using UserData = VireoLoopUserDataUtils;
using UUIDUserData = VireoLoopUUIDUserDataUtils;

namespace {

/// Whether the chunk cannot be stored in CAF: its id stands for no UUID, and "uuid" items of others are not its own.
bool hasNoPlaceInCAF(const VireoLoopBaseChunk& chunk)
{
    return chunk.cafChunkID() == tagging::kCAFUUIDChunk && !chunk.cafChunkIsUUIDChunk();
}

} // namespace

void GenericCafChunkReader::readChunk()
{
    if (hasNoPlaceInCAF(chunk_))
        return;
    const auto data = chunk_.cafChunkIsUUIDChunk() ? UUIDUserData::read(file_, *chunk_.cafChunkUUID())
                                                   : UserData::read(file_, chunk_.cafChunkID(), 0);
    if (data)
        chunk_.chunkData().setChunkData(*data, fourCC("caff"));
}

bool GenericCafChunkWriter::writeChunk()
{
    const auto data = chunk_.chunkData().chunkDataForAudioFileType(fourCC("caff"));
    if (!data || hasNoPlaceInCAF(chunk_))
        return false;
    return chunk_.cafChunkIsUUIDChunk() ? UUIDUserData::write(file_, *chunk_.cafChunkUUID(), *data)
                                        : UserData::write(file_, chunk_.cafChunkID(), 0, *data);
}

bool GenericCafChunkRemover::removeChunk()
{
    if (hasNoPlaceInCAF(chunk_))
        return true;
    return chunk_.cafChunkIsUUIDChunk() ? UUIDUserData::removeAll(file_, *chunk_.cafChunkUUID())
                                        : UserData::removeAll(file_, chunk_.cafChunkID());
}

void GenericAifChunkReader::readChunk()
{
    if (chunk_.aifChunkID() == 0)
        return;
    if (const auto data = UserData::read(file_, chunk_.aifChunkID(), 0))
        chunk_.chunkData().setChunkData(*data, fourCC("AIFF"));
}

bool GenericAifChunkWriter::writeChunk()
{
    if (chunk_.aifChunkID() == 0)
        return true; // such a chunk exists in CAF files only
    const auto data = chunk_.chunkData().chunkDataForAudioFileType(fourCC("AIFF"));
    return data && UserData::write(file_, chunk_.aifChunkID(), 0, *data);
}

bool GenericAifChunkRemover::removeChunk()
{
    return chunk_.aifChunkID() == 0 || UserData::removeAll(file_, chunk_.aifChunkID());
}
