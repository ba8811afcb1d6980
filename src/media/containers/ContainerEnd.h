// The end of a container, as a walk over its chunks finds it.
#pragma once

#include "media/containers/ChunkWalk.h"
#include "media/containers/ContainerHeaders.h"

#include <cstdint>

/// Where a new chunk goes.
struct ContainerEnd {
    ContainerChkExtended header; // in host order
    platform::WalkedChunk last;  // the chunk that it follows
    std::int64_t insertion = 0;
    std::int64_t dataSize = 0; // of the chunk "data"
};
