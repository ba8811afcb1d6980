// The chunk "cue " of WAVE files: points in the sound, which "adtl" names and "smpl" loops refer to. Page:
// docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// One point; these members, top to bottom, are its 24 bytes.
struct CuePoint {
    Packed<std::uint32_t> id;                    //  0  of its own within the file
    Packed<std::uint32_t> position;              //  4  in the order of a playlist; mostly as sampleOffset
    Packed<FourCC> dataChunkId = fourCC("data"); //  8  of the chunk that holds the point: "data" or "slnt"
    Packed<std::uint32_t> chunkStart;            // 12  0 when there is one "data"
    Packed<std::uint32_t> blockStart;            // 16  0 of linear PCM
    Packed<std::uint32_t> sampleOffset;          // 20  the frame after the point

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, id, position, chunkStart, blockStart, sampleOffset);
        turnFields(std::endian::big, dataChunkId);
    }
    friend bool operator==(const CuePoint&, const CuePoint&) = default;
};
static_assert(sizeof(CuePoint) == 24 && offsetof(CuePoint, sampleOffset) == 20);

/// Published source: RIFF 1.0 of 1991, Cue-Points Chunk.
struct KT_EXPORT CueList {
    /// Null for fewer than 4 bytes. In RIFX the order is big.
    static std::optional<CueList> read(BytesView body, std::endian order = std::endian::little);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write(std::endian order = std::endian::little) const;
    /// The first point of an id; null when there is none.
    const CuePoint* find(std::uint32_t id) const;
    friend bool operator==(const CueList&, const CueList&) = default;

    std::vector<CuePoint> points;    // those that are there
    std::uint32_t missingPoints = 0; // stated, and not there: write() states them again
    Bytes behind;                    // what no point counts
};
