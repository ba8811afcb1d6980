// What is wrong with a container: its headers against what is there, and against the rules of its format. Published
// sources as in ContainerTraits.h and StoredFormat.h.
#pragma once

#include "media/containers/HeaderWindow.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <vector>

namespace platform {

/// One thing that is wrong.
struct ContainerFinding {
    /// What it is, and what `stated` and `found` then mean.
    enum class Kind : std::uint8_t {
        containerIsCut,    // stated: where the container ends; found: the length of the file
        bytesBehind,       // stated: where the container ends; found: how many bytes follow
        chunkBehind,       // the chunk begins where the container has ended, at `stated`
        chunkReachesOut,   // stated: where the container ends; found: where the chunk does
        chunkIsShort,      // stated: how many bytes every such chunk has; found: how many this has
        idIsNoName,        // the chunk's name is not four printable characters
        chunkIsCut,        // stated: the size of the body; found: how much of it is there
        sizeIsOpen,        // it was never filled in; found: how many bytes there are to the end of the file
        countIsOpen,       // the number of frames was never filled in; found: how many there are
        noChunk,           // found: how many bytes are no chunk
        padIsMissing,      // after a body of odd size; found: that size
        padIsNotZero,      // found: the byte; nothing after it was examined
        repeated,          // only one such chunk may be there; stated: where the first is
        formatIsLate,      // it follows the samples, or in CAF is not the first chunk
        formatIsMissing,   // it is missing or too short
        formatIsWrong,     // it says what cannot be: no channels, no rate, frames of another size than their samples
        soundIsMissing,    // the chunk of the samples is missing
        soundIsUneven,     // stated: bytes of a frame; found: how many are left over after the last
        byteRateDiffers,   // the format states `stated` bytes a second, and there are `found`
        factIsMissing,     // the coding needs its count of frames
        framesDiffer,      // the chunk counts `stated` frames, and there are `found`
        sizes64AreMissing, // a 64-bit WAVE file without a "ds64"
        sizes64Differ,     // stated: the size in the chunk, or the container; found: the size in the "ds64"
        versionIsMissing,  // AIFC's "FVER"
        offsetIsWrong,     // stated: where AIFF's samples begin in their chunk; found: how many bytes it has
        tableIsShort,      // stated: the entries that a "ds64" counts; found: how many fit in it
        digestIsWrong,     // found: its size in bytes, which no MD5 has
        digestDiffers      // the samples have another MD5 than the chunk states
    };

    Kind kind;                // what is wrong
    FourCC chunk = 0;         // the chunk that it is about; the container's first four bytes when it is that
    std::uint64_t offset = 0; // in the file, of the chunk's header or of the bytes
    std::uint64_t stated = 0, // as `kind` says
        found = 0;            // as `kind` says
};

/// Checks the headers of the container in `window` and adds what is wrong to `findings`, at most kMostFindings, in
/// file order except for what only the end shows. 0; kStatusParameterError for a file that is no known container;
/// kStatusEndOfFile for one that ends in its first header; else the status of a failed read.
KT_EXPORT std::int32_t checkContainer(HeaderWindow& window, std::vector<ContainerFinding>& findings);

inline constexpr std::size_t kMostFindings = 1000; // a limit, so that a damaged file cannot fill memory

} // namespace platform
