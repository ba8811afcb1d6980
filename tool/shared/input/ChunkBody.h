// Where a chunk's body is, in any container.
#pragma once

#include "audiofile/CAudioFileIO.h"

/// A chunk whose bytes are all there.
struct ChunkBody {
    std::int64_t header = 0; // file offsets
    std::int64_t offset = 0;
    std::int64_t size = 0;
};

/// Of several chunks of the id, the one that the library answers with. Throws Failure when there is none, and when it
/// claims more bytes than are there.
ChunkBody requireChunk(CAudioFileIO& file, FourCC id);
