// What the library knows of each container, in one table: how a file begins, where its chunks lie, what they are for,
// and which edits it allows. Published sources: EA IFF 85, AIFF 1.3 and AIFC, EBU Tech 3306 (RF64), ITU-R BS.2088
// (BW64), CAF 1.0, the Wave64 file format (2003), the manual page audio(4) of AU.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <bit>
#include <cstdint>
#include <optional>
#include <span>

namespace platform {

struct StoredFormat;

/// The containers whose chunks or samples the library reads itself.
enum class ContainerKind : std::uint8_t {
    riff,   // RIFF, RF64 and BW64 of form WAVE
    iff,    // FORM of form AIFF or AIFC
    caf,    // CAF
    rifx,   // RIFF whose numbers and samples are big-endian; only read
    wave64, // only read
    au,     // only read; its header and its samples count as two chunks
    rex2    // its chunks are known, its sound is not
};

/// What a chunk is for.
enum class ChunkRole : std::uint8_t {
    userData,   // what the file carries besides its samples
    filler,     // unused room
    supporting, // about the samples; can be missed, or made anew
    essential   // without it the sound cannot be read; a container has one
};

/// One row of the table.
struct ContainerTraits {
    /// A chunk that is not user data.
    struct Role {
        FourCC id;      // of the chunk
        ChunkRole role; // what it is for
    };

    ContainerKind kind;                  // the container
    FourCC fileType;                     // as hosts know it; "AIFF" for iff
    bool hasChunks;                      // whether ForEachChunk lists its chunks
    bool isEditable;                     // chunks can be added and removed, user data set, samples written
    std::endian order;                   // of numbers in headers
    std::uint8_t firstChunk;             // offset of the first chunk
    std::uint8_t chunkHeaderSize;        // bytes of a chunk's header
    std::uint8_t alignment;              // chunks are padded to a multiple of this, in bytes
    std::uint64_t largestChunk;          // bytes of a body that a header can state
    FourCC formatId;                     // of the chunk that describes the samples; 0 where unknown
    FourCC soundId;                      // of the chunk that holds the samples
    std::span<const Role> roles;         // chunks that are not user data
    bool (*recognises)(BytesView start); // whether a file that begins so is of this kind
    /// Reads the chunk `formatId`; null where unknown.
    std::optional<StoredFormat> (*readFormat)(BytesView body, FourCC formType);

    /// How many pad bytes follow a body of this size.
    std::uint64_t padOf(std::uint64_t size) const { return -size & (alignment - 1U); }
};

/// The row of a container; every kind has one.
KT_EXPORT const ContainerTraits& traitsOf(ContainerKind kind);

/// How many of a file's first bytes are needed.
inline constexpr std::size_t kMostOfContainerStart = 40;
/// The container that a file is by its first bytes, at most kMostOfContainerStart of them; null for an unknown one.
KT_EXPORT const ContainerTraits* recogniseContainer(BytesView start);

/// What a chunk is for in its container; every guard of an edit uses this one list.
KT_EXPORT ChunkRole roleOfChunk(ContainerKind kind, FourCC id);

} // namespace platform
