// The chunk "plst" of WAVE files: in which order points of "cue " are played. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

/// One segment; these members, top to bottom, are its 12 bytes.
struct PlaylistSegment {
    Packed<std::uint32_t> cueId;  // 0  of the point that it begins at
    Packed<std::uint32_t> length; // 4  in frames
    Packed<std::uint32_t> loops;  // 8  how often it is played

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order) { turnFields(order, cueId, length, loops); }
    friend bool operator==(const PlaylistSegment&, const PlaylistSegment&) = default;
};
static_assert(sizeof(PlaylistSegment) == 12);

/// Published source: RIFF 1.0 of 1991, Playlist Chunk.
struct KT_EXPORT PlaylistChunk {
    /// Null for fewer than 4 bytes. In RIFX the order is big.
    static std::optional<PlaylistChunk> read(BytesView body, std::endian order = std::endian::little);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write(std::endian order = std::endian::little) const;
    friend bool operator==(const PlaylistChunk&, const PlaylistChunk&) = default;

    std::vector<PlaylistSegment> segments; // those that are there
    std::uint32_t missingSegments = 0;     // stated, and not there: write() states them again
    Bytes behind;                          // what no segment counts
};
