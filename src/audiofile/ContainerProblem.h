// What keeps the chunks of a container from being read, or changed without loss.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>

/// A problem, with the facts that a sentence about it needs.
struct [[nodiscard]] ContainerProblem {
    /// What went wrong.
    enum class Kind : std::uint8_t {
        none,
        status,      // a call of the library failed
        empty,       // the file has no bytes
        noContainer, // the file is no container that the library knows
        unknown,     // nor any other kind of sound that it knows
        headerCut,   // the file ends within its header
        noFormat,    // the chunk `id`, which says what the samples are, is missing or too short
        noSound,     // the chunk `id`, which holds the samples, is missing; 0 where they have none
        noIndex,     // the part `id`, which says where the samples are, is missing
        onlyRead,    // containers of this kind are only read (RIFX, Wave64)
        chunks,      // they cannot be walked
        reading,     // bodies cannot be read, to be compared
        adding,      // CAudioFileIO::AddChunk gave `status`, the system `systemError`
        notRemoved,  // the chunk `id` is still there: its body cannot be read, or is empty in CAF
        notFound,    // the new chunk is missing, or not as it should be
        misplaced,   // the new chunk is not after everything that was there
        cutShort,    // the last chunk is not whole
        changed,     // the chunk `id`, which was to stay, has changed, gone or appeared
        tailChanged  // what follows the chunks has changed
    };

    Kind kind = Kind::none;  // none: all is well
    std::int32_t status = 0; // of `status` and `adding`, else 0
    int systemError = 0;     // errno; 0 when the system did not fail
    FourCC id = 0;           // of the chunk that the problem is about, else 0

    /// A problem with a status; none for 0.
    static ContainerProblem ofStatus(std::int32_t status, Kind kind = Kind::status)
    {
        return status == 0 ? ContainerProblem() : ContainerProblem{kind, status};
    }

    /// Whether there is a problem.
    explicit operator bool() const { return kind != Kind::none; }
    /// As a status code (platform/core/Status.h), never 0 when there is a problem.
    KT_EXPORT std::int32_t Status() const;
    /// The problem as words about the file: "is empty"; empty for none.
    KT_EXPORT std::string Description() const;
};
