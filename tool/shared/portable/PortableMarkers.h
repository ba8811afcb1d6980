// Named places in the sound, as WAVE, AIFF and CAF have them, moved to where the sound has gone.
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
    /// Of RIFX the order is big. What is written is little-endian, and of linear PCM.
    CueMove(const SoundChange& change, std::endian order, bool isLinearPCM)
        : change_(change),
          order_(order),
          isLinearPCM_(isLinearPCM)
    {
    }

    /// Empty when no point is left.
    Bytes movedCues(BytesView body);
    /// Behind movedCues. Empty when nothing is left.
    Bytes movedLabels(BytesView body) const;
    std::size_t dropped() const { return dropped_.size(); }

private:
    bool keepsPlaces() const { return change_.keepsPlaces() && order_ == std::endian::little; }

    SoundChange change_;
    std::endian order_;
    bool isLinearPCM_;
    std::unordered_set<std::uint32_t> dropped_; // ids
};

struct PortableMarker {
    std::uint32_t id = 0;
    std::uint64_t frame = 0;
    std::string name; // UTF-8
};

/// The markers of one file, for one of another kind.
struct PortableMarkers {
    std::vector<PortableMarker> markers;
    bool hasMore = false; // than places and names: remarks, ranges

    void addFromWAVE(BytesView cues, const std::vector<BytesView>& lists, std::endian order, bool isLinearPCM);
    void addFromAIFF(BytesView marks);
    /// `names` is the body of the "strg", or nothing.
    void addFromCAF(BytesView marks, BytesView names);

    /// At their new places; returns how many were cut off.
    std::size_t move(const SoundChange& change);
    /// None where there are none. `left` counts those that the type has no room for.
    std::vector<HeldChunk> chunksFor(FourCC fileType, std::size_t& left) const;
};

/// The body of a "MARK" with its markers moved, and nothing else changed; `dropped` counts those that were cut off.
Bytes movedMarks(BytesView body, const SoundChange& change, std::size_t& dropped);
/// The same of a CAF "mark".
Bytes movedCAFMarkers(BytesView body, const SoundChange& change, std::size_t& dropped);
