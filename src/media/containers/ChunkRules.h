// What the rules of the formats say of single chunks: which a file has one of, and how long they are at least.
// Published sources as in ContainerTraits.h; EBU Tech 3285 of "bext", RIFF of 1991 and its successors of others.
#pragma once

#include "media/containers/ContainerTraits.h"

namespace platform {

/// Whether a file may have one such chunk only.
bool isSingleChunk(ContainerKind kind, FourCC id);

/// Bytes of the body that belong to every such chunk; 0 where there is no rule.
std::uint32_t leastSizeOfChunk(ContainerKind kind, FourCC id);

} // namespace platform
