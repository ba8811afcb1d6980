#include "loops/overview/CAFOverview.h"

#include <algorithm>
#include <cstring>

namespace {

Packed<std::int16_t> widened(std::int8_t value)
{
    return inByteOrder(static_cast<std::int16_t>(value * 256), std::endian::big);
}

std::int8_t highByte(std::int16_t stored)
{
    const int value = inByteOrder(stored, std::endian::big) >> 8;
    return static_cast<std::int8_t>(std::max(value, -127));
}

OverviewPoint folded(OverviewPoint a, OverviewPoint b)
{
    return {std::min(a.minimum, b.minimum), std::max(a.maximum, b.maximum)};
}

} // namespace

bool makeCAFOverview(const KTMem& overview, Packed<std::uint32_t> editCount, KTMem& body)
{
    const std::size_t count = OverviewPoints(overview);
    const OverviewPoint* points = OverviewPointsOf(overview);
    const CAFOverviewHeader header{editCount,
                                   inByteOrder(static_cast<std::uint32_t>(kOverviewFramesPerPoint), std::endian::big)};
    if (!body.allocate(sizeof header + count * sizeof(CAFOverviewPair)))
        return false;
    std::memcpy(body.data(), &header, sizeof header);
    std::transform(points, points + count, reinterpret_cast<CAFOverviewPair*>(body.data() + sizeof header),
                   [](OverviewPoint point) {
                       return CAFOverviewPair{widened(point.minimum), widened(point.maximum)};
                   });
    return true;
}

CAFOverviewFolder::CAFOverviewFolder(KTMem& block, std::int64_t frames, std::int64_t framesPerPair)
    : points_(OverviewPointsOf(block)),
      frames_(frames),
      framesPerPair_(framesPerPair)
{
}

void CAFOverviewFolder::add(CAFOverviewPair pair)
{
    const std::int64_t end = std::min(frame_ + framesPerPair_, frames_);
    const OverviewPoint added{highByte(pair.minimum), highByte(pair.maximum)};
    for (std::int64_t point = frame_ / kOverviewFramesPerPoint; point < OverviewPointCount(end); ++point) {
        const bool isFirst = frame_ <= point * kOverviewFramesPerPoint;
        points_[point] = isFirst ? added : folded(points_[point], added);
    }
    frame_ = end;
}

void CAFOverviewFolder::finish()
{
    if (isDone() || frame_ % kOverviewFramesPerPoint == 0)
        return;
    OverviewPoint& last = points_[frame_ / kOverviewFramesPerPoint];
    last = folded(last, OverviewPoint());
}
