// What is off in a container: what its headers promise against what is there, and what breaks the rules of its format.
// Published sources as in ContainerTraits.h and StoredFormat.h.
#pragma once

#include "media/containers/HeaderWindow.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <vector>

namespace platform {

struct ContainerFinding {
    enum class Kind : std::uint8_t {
        containerIsCut,  // stated: where the container ends; found: the length of the file
        bytesBehind,     // stated: where the container ends; found: how many bytes follow
        chunkBehind,     // the chunk begins where the container has ended, at `stated`
        chunkReachesOut, // stated: where the container ends; found: where the chunk does
        chunkIsShort,    // stated: how many bytes every such chunk has; found: how many this has
        idIsNoName,      // the chunk's name is not four printable characters
        chunkIsCut,      // stated: the size of the body; found: how much of it is there
        sizeIsOpen,      // never filled in; found: how many bytes there are to the end of the file
        countIsOpen,     // the number of frames was never filled in; found: how many there are
        noChunk,         // found: how many bytes stand there that are no chunk
        padIsMissing,    // behind a body of odd size; found: that size
        padIsNotZero,    // found: the byte. What follows was not looked at
        repeated,        // a chunk of which one may be there; stated: where the first stands
        formatIsLate,    // behind the samples, or in CAF not first
        formatIsMissing, // or too short
        formatIsWrong,   // says what cannot be: no channels, no rate, frames of another size than their samples
        soundIsMissing,
        soundIsUneven,     // stated: bytes of a frame; found: how many are left over behind the last
        byteRateDiffers,   // the format says `stated` bytes in a second, there are `found`
        factIsMissing,     // of a coding whose frames only it counts
        framesDiffer,      // the chunk counts `stated` frames, there are `found`
        sizes64AreMissing, // a 64-bit WAVE file without a "ds64"
        sizes64Differ,     // stated: the own size of the chunk, or of the container; found: what the "ds64" says of it
        versionIsMissing,  // AIFC's "FVER"
        offsetIsWrong,     // stated: where AIFF's samples begin in their chunk; found: how many bytes that has
        tableIsShort,      // stated: entries that a "ds64" counts; found: those that it has room for
        digestIsWrong,     // found: its size in bytes, which is that of no MD5
        digestDiffers      // the MD5 that the chunk states is not that of the samples
    };

    Kind kind;
    FourCC chunk = 0;         // of the container itself its first four bytes
    std::uint64_t offset = 0; // in the file, of the chunk's header or of the bytes
    std::uint64_t stated = 0, found = 0;
};

/// Looks through the container in `window`, at its headers alone, and adds what is off to `findings`, in file order but
/// for what only the end shows; at most kMostFindings. 0; kStatusParameterError for a file that is no container known
/// here; kStatusEndOfFile for one that ends in its first header; the status of a read that failed.
KT_EXPORT std::int32_t checkContainer(HeaderWindow& window, std::vector<ContainerFinding>& findings);

inline constexpr std::size_t kMostFindings = 1000;

} // namespace platform
