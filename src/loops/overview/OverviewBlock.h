// The overview block: a compact picture of an audio file in a KTMem. It has a point for every 256 frames, their
// lowest and highest sample. Page: docs/formats/overview.md.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/KTMem.h"

#include <cstddef>
#include <cstdint>

inline constexpr std::int64_t kOverviewFramesPerPoint = 256; // frames that a point stands for
inline constexpr std::size_t kOverviewHeaderSize = 8;        // in bytes

/// One point; both values lie in [-127, 127]. All channels are folded into it. In a stereo file, however, the maximum
/// is the peak of the left channel, and the minimum the negated peak of the right one.
struct OverviewPoint {
    std::int8_t minimum = 0; // lowest sample
    std::int8_t maximum = 0; // highest sample
};
static_assert(sizeof(OverviewPoint) == 2);

/// The header of a block, in host order; the points follow it.
struct OverviewHeader {
    std::uint32_t frames = 0;   // 2^32 - 1 for as many and more
    std::uint32_t reserved = 0; // always 0
};
static_assert(sizeof(OverviewHeader) == kOverviewHeaderSize);

/// How many points so many frames need; 0 for counts below 1.
constexpr std::int64_t OverviewPointCount(std::int64_t frames)
{
    return frames < 1 ? 0 : (frames - 1) / kOverviewFramesPerPoint + 1;
}

/// The size of the block for so many frames, in bytes.
constexpr std::size_t OverviewBlockSize(std::int64_t frames)
{
    return kOverviewHeaderSize + sizeof(OverviewPoint) * static_cast<std::size_t>(OverviewPointCount(frames));
}

/// Whether the block has a header and exactly the points that its frame count needs, one at least.
KT_EXPORT bool IsOverviewBlock(const KTMem& block);
/// The frames that the header counts; 0 for a block too small for a header.
KT_EXPORT std::uint32_t OverviewFrames(const KTMem& block);
/// Sets the frame count, clamped to what the header holds. The block must have a header.
KT_EXPORT void SetOverviewFrames(KTMem& block, std::int64_t frames);
/// How many points the block has; 0 for a block too small for a header.
KT_EXPORT std::size_t OverviewPoints(const KTMem& block);
/// The points, valid until the block changes. The block must have a header.
KT_EXPORT const OverviewPoint* OverviewPointsOf(const KTMem& block);
/// The points, to be changed; valid until the block changes. The block must have a header.
KT_EXPORT OverviewPoint* OverviewPointsOf(KTMem& block);
