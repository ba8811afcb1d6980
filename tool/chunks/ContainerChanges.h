// The changes that the command makes to the chunks of a container, each proven by a look at what came of it.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"
#include "tool/shared/edits/EditGuards.h"

#include <string>

/// What of an id is in the container at the path. Throws Failure for what is no container or cannot be read.
ChunkSurvey surveyOf(const std::string& path, FourCC id);

/// Removes every chunk of the id, which are `count`. Throws Failure.
void removeChunksFrom(const std::string& path, FourCC id, std::int64_t count);

struct NewChunk {
    FourCC id = 0;
    const Bytes& body;
    bool replaces = false; // all that have its id
    bool isForced = false; // also where it does not come to stand behind all that is there
};
/// Throws Failure.
void addChunkTo(const std::string& path, const NewChunk& chunk);
