// What can go wrong when a container is edited. The library does what it is told; the command looks first, and asks
// for --force where sound or other data would be lost.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>
#include <optional>
#include <string>

/// What a walk over a container found, with an eye on one id.
struct ChunkSurvey {
    ContainerExtent extent;
    std::int64_t count = 0;          // chunks of the id
    std::int64_t total = 0;          // bytes of their bodies
    std::optional<ChunkEntry> found; // the one that the library answers with: the last; in CAF the first with a body
    std::optional<ChunkEntry> last;  // of the container

    bool isCAF() const { return extent.id == kCaff; }
};

/// Throws Failure when the container cannot be walked.
ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id);

/// Why a chunk should not be added, and what would be lost; none when nothing speaks against it. Throws Failure when
/// the container cannot be walked.
std::optional<std::string> objectionToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id);
/// The same for removing every chunk of the id.
std::optional<std::string> objectionToRemoving(const ChunkSurvey& survey, FourCC id);
