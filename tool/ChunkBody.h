// Where a chunk's body is, in any container.
#pragma once

#include "audiofile/CAudioFileIO.h"

/// File offset of the first byte behind the chunk's header.
inline std::int64_t bodyOffset(const ChunkEntry& chunk, const ContainerExtent& extent)
{
    const std::size_t header = extent.id == kCaff ? sizeof(CAFChunkHeader) : sizeof(ChkHeader);
    return chunk.offset + static_cast<std::int64_t>(header);
}
