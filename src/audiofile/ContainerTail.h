// The end of a container, where the next chunk goes.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>

/// The end of a container.
struct ContainerTail {
    /// Why adding a chunk would lose it or something else.
    enum class Fault {
        none,     // nothing, or what CAudioFileIO::PrepareToAppend puts right
        noChunk,  // there is no chunk to follow
        cutShort, // the last chunk claims more than is there, in CAF, or has a negative size
        noId,     // the bytes in place of the last chunk are no chunk
        stray,    // more than a chunk header, or sound that the chunk's size does not count, follows the last chunk
    };
    Fault fault = Fault::none; // none: a chunk can be added
    ContainerExtent extent;    // of the container
    ChunkEntry last;           // offset 0 when there is none
    std::int64_t end = 0;      // of the last chunk, with its pad byte
    std::int64_t stray = 0;    // bytes of the file after that; negative: missing
};

/// Finds out whether CAudioFileIO::PrepareToAppend would succeed, without writing: it refuses where there is a fault.
/// The status is that of ForEachChunk.
KT_EXPORT std::int32_t ExamineContainerTail(CAudioFileIO& file, ContainerTail& tail);
