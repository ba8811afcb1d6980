// Named positions of WAVE, AIFF and CAF files, adapted to changed sound.
#pragma once

#include "platform/core/Bytes.h"
#include "tool/shared/portable/PortableTexts.h"
#include "tool/shared/portable/SoundChange.h"

#include <string>
#include <unordered_set>
#include <vector>

/// The chunks "cue " and LIST "adtl" of one WAVE file, whose points are moved and dropped together.
class CueMove {
public:
    /// The order is big-endian for RIFX. The result is little-endian and for linear PCM.
    CueMove(const SoundChange& change, std::endian order, bool isLinearPCM)
        : change_(change),
          order_(order),
          isLinearPCM_(isLinearPCM)
    {
    }

    /// Empty if no point is left.
    Bytes movedCues(BytesView body);
    /// Call after movedCues. Empty if nothing is left.
    Bytes movedLabels(BytesView body) const;
    std::size_t dropped() const { return dropped_.size(); }

private:
    bool keepsPlaces() const { return change_.keepsPlaces() && order_ == std::endian::little; }

    SoundChange change_;
    std::endian order_;
    bool isLinearPCM_;
    std::unordered_set<std::uint32_t> dropped_; // ids of dropped points
};

struct PortableMarker {
    std::uint32_t id = 0;
    std::uint64_t frame = 0;
    std::string name; // UTF-8
};

/// The markers of one file, for a file of another kind.
struct PortableMarkers {
    std::vector<PortableMarker> markers;
    bool hasMore = false; // details beyond position and name: remarks, ranges

    void addFromWAVE(BytesView cues, const std::vector<BytesView>& lists, std::endian order, bool isLinearPCM);
    void addFromAIFF(BytesView marks);
    /// `names` is the body of "strg", or empty.
    void addFromCAF(BytesView marks, BytesView names);

    /// Moves them to their new positions; returns how many were cut off.
    std::size_t move(const SoundChange& change);
    /// None if there are no markers. `left` counts those for which the type has no room.
    std::vector<HeldChunk> chunksFor(FourCC fileType, std::size_t& left) const;
};

/// The body of a "MARK" with its markers moved and nothing else changed; `dropped` counts those that were cut off.
Bytes movedMarks(BytesView body, const SoundChange& change, std::size_t& dropped);
/// As above for a CAF "mark".
Bytes movedCAFMarkers(BytesView body, const SoundChange& change, std::size_t& dropped);
