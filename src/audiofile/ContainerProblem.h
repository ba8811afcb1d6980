// What kept the chunks of a container from being looked at, or changed so that nothing else is lost.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>

/// With the facts that a sentence about it needs. Tests true when there is one.
struct [[nodiscard]] ContainerProblem {
    enum class Kind : std::uint8_t {
        none,
        status,      // a call of the library failed
        empty,       // the file is
        noContainer, // that is known
        unknown,     // nor any other kind of sound
        headerCut,   // the file ends within its header
        noFormat,    // the chunk `id`, which says what the samples are, is missing or too short
        noSound,     // the chunk `id`, which holds the samples, is missing; 0 where they have none
        noIndex,     // the part `id`, which says where the samples are, is missing
        onlyRead,    // its kind is (RIFX, Wave64)
        chunks,      // cannot be walked
        reading,     // bodies cannot be read to compare them
        adding,      // CAudioFileIO::AddChunk gave `status`, the system `systemError`
        notRemoved,  // the chunk `id` is still there: its body cannot be read, or is empty in CAF
        notFound,    // the new chunk is not, or not as it should be
        misplaced,   // the new chunk was not put behind all that is there
        cutShort,    // the last chunk is not whole
        changed,     // the chunk `id`, which was to stay, is not as it was, or gone, or new
        tailChanged  // what stands behind the chunks is not as it was
    };

    Kind kind = Kind::none;
    std::int32_t status = 0;
    int systemError = 0; // errno, 0 when it was not the system
    FourCC id = 0;

    /// None for 0.
    static ContainerProblem ofStatus(std::int32_t status, Kind kind = Kind::status)
    {
        return status == 0 ? ContainerProblem() : ContainerProblem{kind, status};
    }

    explicit operator bool() const { return kind != Kind::none; }
    /// As a status code (platform/core/Status.h), never 0 when there is a problem.
    KT_EXPORT std::int32_t Status() const;
    /// In words, about the file: "is empty"; empty when there is none.
    KT_EXPORT std::string Description() const;
};
