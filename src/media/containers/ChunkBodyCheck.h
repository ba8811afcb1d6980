// Finds faults inside single chunks, in the fields that hold them together.
#pragma once

#include "media/containers/ChunkWalk.h"
#include "media/containers/ContainerCheck.h"

#include <functional>

namespace platform {

/// Whether the four bytes can be a chunk's name; false for null.
bool isChunkName(const std::byte* bytes);

/// Checks a chunk whose bytes are all present: its name, its minimum size, the table of a "ds64", the chunks of a list,
/// the offset of AIFF's samples.
void checkChunkBody(HeaderWindow& window, const Container& container, const WalkedChunk& chunk,
                    const std::function<void(const ContainerFinding&)>& add);

} // namespace platform
