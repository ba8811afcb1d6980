// Markers of CAF files: the chunk "mark", and what "regn" is made of. Page: docs/formats/caf.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

#include <cstddef>

/// A moment by time code; 8 bytes, all of 0xFF when there is none.
struct CAFTimecode {
    Packed<std::int8_t> hours;                  // 0  0 to 23; -1 when there is none
    Packed<std::int8_t> minutes;                // 1  0 to 59
    Packed<std::int8_t> seconds;                // 2  0 to 59
    Packed<std::int8_t> frames;                 // 3  within the second
    Packed<std::uint32_t> subFrameSampleOffset; // 4  samples after the frame

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order) { turnFields(order, subFrameSampleOffset); }
    friend bool operator==(const CAFTimecode&, const CAFTimecode&) = default;
};

/// One marker; these members, top to bottom, are its 28 bytes.
struct CAFMarker {
    Packed<FourCC> type;           //  0  0 generic, "pbeg" and "pend" program, "rbeg" and "rend" region, "tmpo" …
    Packed<double> framePosition;  //  4  frames, with fractions
    Packed<std::uint32_t> id;      // 12  of its text in "strg"
    CAFTimecode timecode;          // 16  of the position, if any
    Packed<std::uint32_t> channel; // 24  0 all channels

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, type, framePosition, id, channel);
        timecode.byteOrder(order);
    }
    friend bool operator==(const CAFMarker&, const CAFMarker&) = default;
};
static_assert(sizeof(CAFMarker) == 28 && offsetof(CAFMarker, id) == 12 && offsetof(CAFMarker, channel) == 24);

/// The chunk "mark". Published source: the published format description, version 1.0, Marker chunk. Big-endian.
struct KT_EXPORT CAFMarkerList {
    /// Null for fewer than 8 bytes.
    static std::optional<CAFMarkerList> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    friend bool operator==(const CAFMarkerList&, const CAFMarkerList&) = default;

    std::uint32_t timecodeType = 0;   // of all time codes: 0 none, 1 24 frames a second, 2 25, 3 30 drop, 4 30, …
    std::vector<CAFMarker> markers;   // those that are there
    std::uint32_t missingMarkers = 0; // stated, and not there: write() states them again
    Bytes behind;                     // what no marker counts
};

/// A stretch of the sound between its markers.
struct CAFRegion {
    /// Bits of `flags`.
    enum Flags : std::uint32_t { kLoops = 1, kPlaysForward = 2, kPlaysBackward = 4 };

    std::uint32_t id = 0;             // of its text in "strg"
    std::uint32_t flags = 0;          // Flags
    std::vector<CAFMarker> markers;   // begin, end, sync point …
    std::uint32_t missingMarkers = 0; // of the last region only
    friend bool operator==(const CAFRegion&, const CAFRegion&) = default;
};

/// The chunk "regn". Published source: as of "mark", Region chunk.
struct KT_EXPORT CAFRegionList {
    /// Null for fewer than 8 bytes.
    static std::optional<CAFRegionList> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    friend bool operator==(const CAFRegionList&, const CAFRegionList&) = default;

    std::uint32_t timecodeType = 0;   // as in CAFMarkerList
    std::vector<CAFRegion> regions;   // those that are there
    std::uint32_t missingRegions = 0; // stated, and not there: write() states them again
    Bytes behind;                     // what no region counts
};
