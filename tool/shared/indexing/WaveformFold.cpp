#include "tool/shared/indexing/WaveformFold.h"

#include <algorithm>

namespace {

OverviewPoint folded(const OverviewPoint& a, const OverviewPoint& b)
{
    return {std::min(a.minimum, b.minimum), std::max(a.maximum, b.maximum)};
}

} // namespace

void WaveformFold::add(std::span<const OverviewPoint> points)
{
    for (const OverviewPoint& point : points)
        add(point, 1);
}

void WaveformFold::add(const OverviewPoint& point, std::int64_t times)
{
    while (times > 0) {
        const std::int64_t taken = std::min(times, pointsEach_ - inOpen_);
        open_ = inOpen_ == 0 ? point : folded(open_, point);
        inOpen_ += taken;
        times -= taken;
        if (inOpen_ == pointsEach_)
            close();
    }
}

LibraryOverview WaveformFold::finish()
{
    if (inOpen_ > 0)
        close();
    LibraryOverview overview;
    overview.framesPerPoint = kOverviewFramesPerPoint * pointsEach_;
    overview.points.assign(reinterpret_cast<const char*>(points_.data()), points_.size() * sizeof(OverviewPoint));
    return overview;
}

void WaveformFold::close()
{
    points_.push_back(open_);
    inOpen_ = 0;
    if (points_.size() <= kMostPoints)
        return;
    static_assert(kMostPoints % 2 == 1, "one more is a number of pairs");
    for (std::size_t i = 0; i < points_.size() / 2; ++i)
        points_[i] = folded(points_[2 * i], points_[2 * i + 1]);
    points_.resize(points_.size() / 2);
    pointsEach_ *= 2;
}
