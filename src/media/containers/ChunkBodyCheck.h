// What is off within single chunks, as far as they say what holds them together.
#pragma once

#include "media/containers/ChunkWalk.h"
#include "media/containers/ContainerCheck.h"

#include <functional>

namespace platform {

/// Whether four bytes may be a chunk's name; false for null.
bool isChunkName(const std::byte* bytes);

/// Of a chunk whose bytes are all there: its name, its least size, the table of a "ds64", the chunks of a list, the
/// offset of AIFF's samples.
void checkChunkBody(HeaderWindow& window, const Container& container, const WalkedChunk& chunk,
                    const std::function<void(const ContainerFinding&)>& add);

} // namespace platform
