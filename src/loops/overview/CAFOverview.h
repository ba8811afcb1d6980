// The overview chunk of CAF, "ovvw", made from an overview block, and blocks made from its pairs. Published source:
// the format description of CAF, version 1.0. Page: docs/formats/overview.md.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "platform/core/Packed.h"

#include <bit>
#include <cstdint>

/// The start of the chunk's body; pairs follow it. Big-endian.
struct CAFOverviewHeader {
    Packed<std::uint32_t> editCount;       // 0  that of the "data" chunk, in the order of the file
    Packed<std::uint32_t> framesPerSample; // 4  frames that a pair stands for
};
static_assert(sizeof(CAFOverviewHeader) == 8);

/// One pair, big-endian.
struct CAFOverviewPair {
    Packed<std::int16_t> minimum; // 0  the lowest sample
    Packed<std::int16_t> maximum; // 2  the highest sample
};
static_assert(sizeof(CAFOverviewPair) == 4);

/// The body of a chunk for the points of a block, each widened to 16 bits. False when memory is short.
bool makeCAFOverview(const KTMem& overview, Packed<std::uint32_t> editCount, KTMem& body);

/// Folds pairs, each of so many frames, into the points of a block. A point gets the lowest minimum and the highest
/// maximum of the pairs that reach into it; missing pairs count as zeros.
class CAFOverviewFolder {
public:
    /// Sizes the block for the frames and fills it with zeros; the block must outlive the folder.
    CAFOverviewFolder(KTMem& block, std::int64_t frames, std::int64_t framesPerPair);

    /// Whether all frames have their pair.
    bool isDone() const { return frame_ >= frames_; }
    /// Adds the next pair, in the order of the file.
    void add(CAFOverviewPair pair);
    /// Folds what is left; call it after the last pair.
    void finish();

private:
    OverviewPoint* points_;
    std::int64_t frames_;
    std::int64_t framesPerPair_;
    std::int64_t frame_ = 0; // where the next pair begins
};
