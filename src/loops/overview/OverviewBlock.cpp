#include "loops/overview/OverviewBlock.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace {

constexpr std::uint32_t kMostFrames = std::numeric_limits<std::uint32_t>::max();

} // namespace

bool IsOverviewBlock(const KTMem& block)
{
    const std::int64_t frames = OverviewFrames(block);
    const auto points = static_cast<std::int64_t>(OverviewPoints(block));
    const bool fits =
        frames == kMostFrames ? points >= OverviewPointCount(frames) : points == OverviewPointCount(frames);
    return points > 0 && fits && block.size() % sizeof(OverviewPoint) == 0;
}

std::uint32_t OverviewFrames(const KTMem& block)
{
    OverviewHeader header;
    if (block.size() >= sizeof header)
        std::memcpy(&header, block.data(), sizeof header);
    return header.frames;
}

void SetOverviewFrames(KTMem& block, std::int64_t frames)
{
    const OverviewHeader header{static_cast<std::uint32_t>(std::clamp<std::int64_t>(frames, 0, kMostFrames)), 0};
    std::memcpy(block.data(), &header, sizeof header);
}

std::size_t OverviewPoints(const KTMem& block)
{
    return block.size() < kOverviewHeaderSize ? 0 : (block.size() - kOverviewHeaderSize) / sizeof(OverviewPoint);
}

const OverviewPoint* OverviewPointsOf(const KTMem& block)
{
    return reinterpret_cast<const OverviewPoint*>(block.data() + kOverviewHeaderSize);
}

OverviewPoint* OverviewPointsOf(KTMem& block)
{
    return reinterpret_cast<OverviewPoint*>(block.data() + kOverviewHeaderSize);
}
