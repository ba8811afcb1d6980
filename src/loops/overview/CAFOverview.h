// The overview chunk of CAF, "ovvw", made of an overview block, and blocks made of its pairs. Published source: the
// format description of CAF, version 1.0. Page: docs/formats/overview.md.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "platform/core/Packed.h"

#include <bit>
#include <cstdint>

/// The start of the chunk's body; pairs follow it. Big-endian.
struct CAFOverviewHeader {
    Packed<std::uint32_t> editCount;       // 0  that of the "data" chunk, as it stands there
    Packed<std::uint32_t> framesPerSample; // 4
};
static_assert(sizeof(CAFOverviewHeader) == 8);

struct CAFOverviewPair {
    Packed<std::int16_t> minimum; // 0
    Packed<std::int16_t> maximum; // 2
};
static_assert(sizeof(CAFOverviewPair) == 4);

/// The body of a chunk for the points of a block, each widened to 16 bits. False when memory is short.
bool makeCAFOverview(const KTMem& overview, Packed<std::uint32_t> editCount, KTMem& body);

/// Folds pairs, each of so many frames, into the points of a block. A point gets the lowest minimum and the highest
/// maximum of the pairs that reach into it; where pairs are missing they count as zeros.
class CAFOverviewFolder {
public:
    /// The block is sized for the frames and filled with zeros; it outlives the folder.
    CAFOverviewFolder(KTMem& block, std::int64_t frames, std::int64_t framesPerPair);

    /// Whether every frame has its pair.
    bool isDone() const { return frame_ >= frames_; }
    /// The next pair, as it is stored.
    void add(CAFOverviewPair pair);
    /// To be called when no pair is left.
    void finish();

private:
    OverviewPoint* points_;
    std::int64_t frames_;
    std::int64_t framesPerPair_;
    std::int64_t frame_ = 0; // where the next pair begins
};
