// What an edit of a container would cost: looked at first, since CAudioFileIO does what it is told.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "audiofile/ContainerProblem.h"
#include "audiofile/ContainerTail.h"

#include <cstdint>
#include <optional>

/// What a walk over a container found, with an eye on one id.
struct ChunkSurvey {
    ContainerExtent extent;
    std::int64_t count = 0;          // chunks of the id
    std::int64_t total = 0;          // bytes of their bodies
    std::optional<ChunkEntry> found; // the one that the library answers with: the last; in CAF the first with a body
    std::optional<ChunkEntry> last;  // of the container
};

/// Problem: chunks.
KT_EXPORT ContainerProblem SurveyChunks(CAudioFileIO& file, FourCC id, ChunkSurvey& survey);

/// Why chunks should not be added or removed: sound or other data would be lost. An edit is possible all the same.
struct ChunkObjection {
    enum class Kind : std::uint8_t {
        none,
        oneOnly,   // the container has such a chunk, which describes or holds its sound, and has room for one
        soundLost, // the chunk to be removed describes or holds the sound
        tail       // `tail.fault` says what would be lost where the new chunk goes
    };
    Kind kind = Kind::none;
    ContainerTail tail;

    explicit operator bool() const { return kind != Kind::none; }
};

/// Of one more chunk of the surveyed id, where CAudioFileIO::PrepareToAppend runs first. Problem: chunks.
KT_EXPORT ContainerProblem ObjectToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id,
                                          ChunkObjection& objection);
/// Of removing every chunk of the surveyed id.
KT_EXPORT ChunkObjection ObjectionToRemoving(const ChunkSurvey& survey, FourCC id);
