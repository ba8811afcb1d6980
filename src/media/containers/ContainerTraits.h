// What a chunk is to its container: the one list by which every guard of an edit goes.
#pragma once

#include "media/containers/StoredFormat.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>

namespace platform {

enum class ChunkRole : std::uint8_t {
    userData,   // what the file carries beside its samples
    filler,     // room
    supporting, // tells of the samples what can be done without, or be made anew
    essential   // without it the sound, or the way to it, is gone; a container has one
};

/// Of the containers that are edited; in others all is user data.
KT_EXPORT ChunkRole roleOfChunk(ContainerKind kind, FourCC id);

} // namespace platform
