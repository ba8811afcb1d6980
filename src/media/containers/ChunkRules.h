// Rules of the formats for single chunks: which may occur only once, and how long they are at least. Published sources
// as in ContainerTraits.h; EBU Tech 3285 for "bext", RIFF of 1991 and its successors for the others.
#pragma once

#include "media/containers/ContainerTraits.h"

namespace platform {

/// Whether a file may have only one such chunk.
bool isSingleChunk(ContainerKind kind, FourCC id);

/// Bytes of the body that every such chunk has; 0 if there is no rule.
std::uint32_t leastSizeOfChunk(ContainerKind kind, FourCC id);

} // namespace platform
