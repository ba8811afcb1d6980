#include "tool/shared/indexing/OverviewPoints.h"

#include "loops/overview/OverviewBlock.h"

#include <algorithm>

namespace {

constexpr std::int64_t kMostPoints = 5625; // 30 seconds at 48 kHz

/// Folds each two points into one.
void halvePoints(std::vector<OverviewPoint>& points)
{
    const std::size_t halves = (points.size() + 1) / 2;
    for (std::size_t i = 0; i < halves; ++i) {
        const OverviewPoint& first = points[2 * i];
        const OverviewPoint& second = 2 * i + 1 < points.size() ? points[2 * i + 1] : first;
        points[i] = {std::min(first.minimum, second.minimum), std::max(first.maximum, second.maximum)};
    }
    points.resize(halves);
}

} // namespace

std::optional<LibraryOverview> overviewOf(CAudioFileIO& file)
{
    const std::unique_ptr<KTMem> block = file.CreateOverview();
    if (!block)
        return std::nullopt;
    const OverviewPoint* const begin = OverviewPointsOf(*block);
    std::vector<OverviewPoint> points(begin, begin + OverviewPoints(*block));
    LibraryOverview overview;
    overview.framesPerPoint = kOverviewFramesPerPoint;
    for (; std::ssize(points) > kMostPoints; overview.framesPerPoint *= 2)
        halvePoints(points);
    overview.points.assign(reinterpret_cast<const char*>(points.data()), points.size() * sizeof(OverviewPoint));
    return overview;
}
