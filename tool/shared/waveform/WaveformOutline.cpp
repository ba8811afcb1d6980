#include "tool/shared/waveform/WaveformOutline.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace {

constexpr double kFramesOfPoint = static_cast<double>(kOverviewFramesPerPoint);

// Lowest, highest and sums of points. Long runs are processed in a fixed number of lanes, which the compiler
// vectorizes: twelve hours have eight million points.
class PointFold {
public:
    PointFold()
    {
        low_.fill(INT8_MAX);
        high_.fill(INT8_MIN);
    }

    void add(std::span<const OverviewPoint> points)
    {
        for (; points.size() >= kLanes; points = points.subspan(kLanes))
            addLanes(points.first<kLanes>());
        for (const OverviewPoint& point : points)
            addLane(0, point);
        count_ += points.size();
    }

    WaveformColumn result() const
    {
        WaveformColumn column{static_cast<float>(*std::min_element(low_.begin(), low_.end())),
                              static_cast<float>(*std::max_element(high_.begin(), high_.end()))};
        std::int64_t lowSum = 0, highSum = 0;
        for (std::size_t i = 0; i < kLanes; ++i) {
            lowSum += lowSum_[i];
            highSum += highSum_[i];
        }
        column.meanLow = static_cast<float>(lowSum) / static_cast<float>(count_);
        column.meanHigh = static_cast<float>(highSum) / static_cast<float>(count_);
        return column;
    }

private:
    static constexpr std::size_t kLanes = 16;

    void addLanes(std::span<const OverviewPoint, kLanes> points)
    {
        for (std::size_t i = 0; i < kLanes; ++i)
            addLane(i, points[i]);
        count_ += kLanes;
    }

    void addLane(std::size_t lane, const OverviewPoint& point)
    {
        low_[lane] = std::min(low_[lane], point.minimum);
        high_[lane] = std::max(high_[lane], point.maximum);
        lowSum_[lane] += point.minimum;
        highSum_[lane] += point.maximum;
    }

    std::array<std::int8_t, kLanes> low_, high_;
    std::array<std::int64_t, kLanes> lowSum_{}, highSum_{};
    std::size_t count_ = 0;
};

} // namespace

std::vector<WaveformColumn> foldedColumns(const Waveform& waveform, double from, double to, int columns)
{
    const auto count = static_cast<std::int64_t>(waveform.points.size());
    const double pointsPerColumn = (to - from) / kFramesOfPoint / columns;
    std::vector<WaveformColumn> result(static_cast<std::size_t>(columns));
    for (int i = 0; i < columns; ++i) {
        const double start = from / kFramesOfPoint + pointsPerColumn * i;
        // A column that ends where a point begins contains none of it, despite rounding.
        constexpr double kSlack = 1e-6;
        const std::int64_t first =
            std::clamp(static_cast<std::int64_t>(std::floor(start + kSlack)), std::int64_t{0}, count - 1);
        const std::int64_t end =
            std::clamp(static_cast<std::int64_t>(std::ceil(start + pointsPerColumn - kSlack)), first + 1, count);
        PointFold fold;
        fold.add(waveform.points.subspan(static_cast<std::size_t>(first), static_cast<std::size_t>(end - first)));
        result[static_cast<std::size_t>(i)] = fold.result();
    }
    return result;
}
