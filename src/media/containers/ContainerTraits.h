// What the library knows of each container, one table: how a file begins, where chunks stand in it, what they are to
// the sound, what may be done. Published sources: EA IFF 85, AIFF 1.3 and AIFC, EBU Tech 3306 (RF64), ITU-R BS.2088
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

enum class ContainerKind : std::uint8_t {
    riff, // RIFF, RF64 and BW64 of form WAVE
    iff,  // FORM of form AIFF or AIFC
    caf,
    rifx,   // RIFF whose numbers and samples are big-endian; only read
    wave64, // only read
    au,     // only read; a header and samples, which stand for two chunks
    rex2    // its chunks are known, its sound is not
};

enum class ChunkRole : std::uint8_t {
    userData,   // what the file carries beside its samples
    filler,     // room
    supporting, // tells of the samples what can be done without, or be made anew
    essential   // without it the sound, or the way to it, is gone; a container has one
};

struct ContainerTraits {
    struct Role {
        FourCC id;
        ChunkRole role;
    };

    ContainerKind kind;
    FourCC fileType; // by which hosts know it; of iff that of AIFF
    bool hasChunks;
    bool isEditable; // chunks are added and removed, user data set, samples written
    std::endian order;
    std::uint8_t firstChunk;      // where the first chunk stands
    std::uint8_t chunkHeaderSize; // bytes ahead of a chunk's body
    std::uint8_t alignment;       // of chunks: bytes behind a body fill it up to a multiple of this
    std::uint64_t largestChunk;   // bytes of a body that its header can state
    FourCC formatId;              // of the chunk that describes the samples; 0 where that is not known
    FourCC soundId;               // of the chunk that holds them
    std::span<const Role> roles;  // of chunks that are not user data
    bool (*recognises)(BytesView start);
    /// Reads the chunk `formatId`; null where that is not known.
    std::optional<StoredFormat> (*readFormat)(BytesView body, FourCC formType);

    /// The bytes behind a body of this size.
    std::uint64_t padOf(std::uint64_t size) const { return -size & (alignment - 1U); }
};

KT_EXPORT const ContainerTraits& traitsOf(ContainerKind kind);

/// How many of a file's first bytes are looked at.
inline constexpr std::size_t kMostOfContainerStart = 40;
/// The container that a file is by its first bytes, at most kMostOfContainerStart of them; null for none of these.
KT_EXPORT const ContainerTraits* recogniseContainer(BytesView start);

/// What a chunk is to its container: the one list by which every guard of an edit goes.
KT_EXPORT ChunkRole roleOfChunk(ContainerKind kind, FourCC id);

} // namespace platform
