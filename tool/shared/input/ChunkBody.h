// The position of a chunk's body in any container.
#pragma once

#include "audiofile/CAudioFileIO.h"

/// A chunk whose bytes are all present.
struct ChunkBody {
    std::int64_t header = 0; // file offsets
    std::int64_t offset = 0;
    std::int64_t size = 0;
};

/// Of several chunks with the id, the one that the library returns. Throws Failure if there is none, and if it claims
/// more bytes than are present.
ChunkBody requireChunk(CAudioFileIO& file, FourCC id);
