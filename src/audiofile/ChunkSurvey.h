// What an edit of a container would cost. Callers ask first, since CAudioFileIO makes every edit that it can.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "audiofile/ContainerProblem.h"
#include "audiofile/ContainerTail.h"

#include <cstdint>
#include <optional>

/// The result of a walk over a container, with the chunks of one id counted.
struct ChunkSurvey {
    ContainerExtent extent;          // of the container
    std::int64_t count = 0;          // how many chunks have the id
    std::int64_t total = 0;          // the bytes of their bodies
    std::optional<ChunkEntry> found; // the chunk that a look-up finds: the last; in CAF the first with a body
    std::optional<ChunkEntry> last;  // of the container
};

/// Walks the container. Problem: chunks.
KT_EXPORT ContainerProblem SurveyChunks(CAudioFileIO& file, FourCC id, ChunkSurvey& survey);

/// Why chunks should not be added or removed: sound or other data would be lost. The edit is possible all the same.
struct ChunkObjection {
    /// The reason.
    enum class Kind : std::uint8_t {
        none,
        oneOnly,   // such a chunk is there; it describes or holds the sound, and a container has room for one
        soundLost, // the chunk to be removed describes or holds the sound
        tail       // `tail.fault` says what would be lost where the new chunk goes
    };
    Kind kind = Kind::none; // none: nothing speaks against the edit
    ContainerTail tail;     // of `tail`

    /// Whether there is an objection.
    explicit operator bool() const { return kind != Kind::none; }
};

/// The objection to one more chunk of the surveyed id, after CAudioFileIO::PrepareToAppend. Problem: chunks.
KT_EXPORT ContainerProblem ObjectToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id,
                                          ChunkObjection& objection);
/// The objection to removing every chunk of the surveyed id.
KT_EXPORT ChunkObjection ObjectionToRemoving(const ChunkSurvey& survey, FourCC id);
