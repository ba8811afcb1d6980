// The chunk "MARK" of AIFF and AIFC files: named points in the sound, which "INST" and "COMT" refer to. Page:
// docs/formats/aiff-metadata.md.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// A point with a name.
struct AIFFMarker {
    std::int16_t id = 0;        // above 0, of its own within the file
    std::uint32_t position = 0; // 0 is before the first frame, 1 after it, and so on
    std::string name;           // at most 255 bytes; more are not written. Mac OS Roman by the source, UTF-8 by many
    std::byte pad{0};           // behind a name of even length
    friend bool operator==(const AIFFMarker&, const AIFFMarker&) = default;
};

/// Published source: Audio Interchange File Format AIFF-C, Marker Chunk. Big-endian: a count of 2 bytes, then for each
/// marker id, position, length of the name, name, and a pad byte when length and name together are odd.
struct KT_EXPORT MarkerList {
    static constexpr std::size_t kMostMarkers = 65535; // more are not written

    /// Null for fewer than 2 bytes.
    static std::optional<MarkerList> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    /// The first marker of an id; null when there is none.
    const AIFFMarker* find(std::int16_t id) const;
    friend bool operator==(const MarkerList&, const MarkerList&) = default;

    std::vector<AIFFMarker> markers;  // those that are there, whole
    std::uint16_t missingMarkers = 0; // stated, and not there: write() states them again
    bool namesArePadded = true;       // false where the writer left the pad bytes out
    Bytes behind;                     // what is no whole marker
};
