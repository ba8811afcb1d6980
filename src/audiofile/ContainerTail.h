// The end of a container, where the next chunk goes.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>

/// What stands at the end of a container.
struct ContainerTail {
    /// What speaks against adding a chunk, because it or something else would be lost.
    enum class Fault {
        none,     // nothing, or what CAudioFileIO::PrepareToAppend puts right
        noChunk,  // there is no chunk to go behind
        cutShort, // the last one claims more than is there, of a CAF file, or has a negative size
        noId,     // what stands in the last one's place is no chunk
        stray,    // a chunk header's worth or more stands behind the last one, or sound that its size does not count
    };
    Fault fault = Fault::none;
    ContainerExtent extent;
    ChunkEntry last;        // offset 0 when there is none
    std::int64_t end = 0;   // of the last chunk, its pad byte included
    std::int64_t stray = 0; // bytes of the file behind that; negative: missing
};

/// Says whether CAudioFileIO::PrepareToAppend would do, and writes nothing: it refuses where there is a fault. The
/// status is that of ForEachChunk.
KT_EXPORT std::int32_t ExamineContainerTail(CAudioFileIO& file, ContainerTail& tail);
