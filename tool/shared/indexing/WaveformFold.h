// Waveforms of bounded size, folded while sound of any length streams by.
#pragma once

#include "loops/overview/OverviewBlock.h"
#include "tool/shared/library/LibraryRecord.h"

#include <span>
#include <vector>

/// Takes points of 256 frames each, and doubles the frames of a point whenever there are more than kMostPoints.
class WaveformFold {
public:
    static constexpr std::size_t kMostPoints = 5625; // 30 seconds at 48 kHz

    void add(std::span<const OverviewPoint> points);
    /// The same point so many times.
    void add(const OverviewPoint& point, std::int64_t times);
    /// Call it once, behind the last point.
    LibraryOverview finish();

private:
    void close();

    std::vector<OverviewPoint> points_;
    OverviewPoint open_;
    std::int64_t inOpen_ = 0;     // the points folded into the open one
    std::int64_t pointsEach_ = 1; // that are folded into one
};
