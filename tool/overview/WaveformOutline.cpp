#include "tool/overview/WaveformOutline.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace {

constexpr double kFramesPerPoint = static_cast<double>(kOverviewFramesPerPoint);

// Lowest, highest and sums of points. Long runs go through lanes of a fixed number, which the compiler makes vectors
// of: twelve hours are eight million points.
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

// A curve through values at rising positions that stays between neighbours: piecewise cubic with limited slopes
// (Fritsch and Butland), flat at every peak.
class MonotoneCurve {
public:
    MonotoneCurve(const std::vector<double>& x, std::vector<double> y) : x_(x), y_(std::move(y)), slope_(y_.size())
    {
        for (std::size_t i = 1; i + 1 < y_.size(); ++i) {
            const double before = (y_[i] - y_[i - 1]) / (x_[i] - x_[i - 1]);
            const double after = (y_[i + 1] - y_[i]) / (x_[i + 1] - x_[i]);
            if (before * after > 0)
                slope_[i] = 2 * before * after / (before + after);
        }
    }

    /// Between positions `i` and `i` + 1, at `part` of the way.
    double at(std::size_t i, double part) const
    {
        const double length = x_[i + 1] - x_[i], rest = 1 - part;
        return y_[i] * (1 + 2 * part) * rest * rest + y_[i + 1] * part * part * (3 - 2 * part) +
               length * (slope_[i] * part * rest * rest - slope_[i + 1] * part * part * rest);
    }

private:
    const std::vector<double>& x_;
    std::vector<double> y_;
    std::vector<double> slope_;
};

} // namespace

std::vector<WaveformColumn> foldedColumns(const Waveform& waveform, double from, double to, int columns)
{
    const auto count = static_cast<std::int64_t>(waveform.points.size());
    const double pointsPerColumn = (to - from) / kFramesPerPoint / columns;
    std::vector<WaveformColumn> result(static_cast<std::size_t>(columns));
    for (int i = 0; i < columns; ++i) {
        const double start = from / kFramesPerPoint + pointsPerColumn * i;
        // A column that ends where a point begins has nothing of it, whatever rounding says.
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

std::vector<WaveformVertex> smoothOutline(const Waveform& waveform, double from, double to, int columns)
{
    // The points in sight, and a neighbour on each side for the curve to come from and go to. Left of the first centre
    // and right of the last the outline runs level: a point more, of the same value, at each end.
    const double columnsPerFrame = columns / (to - from);
    const auto count = static_cast<std::int64_t>(waveform.points.size());
    const auto first = std::max(static_cast<std::int64_t>(std::floor(from / kFramesPerPoint)) - 2, std::int64_t{0});
    const auto end = std::min(static_cast<std::int64_t>(std::ceil(to / kFramesPerPoint)) + 2, count);
    std::vector<double> x, low, high;
    const auto add = [&](double frame, const OverviewPoint& point) {
        x.push_back((frame - from) * columnsPerFrame);
        low.push_back(point.minimum);
        high.push_back(point.maximum);
    };
    const auto pointAt = [&](std::int64_t i) { return waveform.points[static_cast<std::size_t>(i)]; };
    add(static_cast<double>(first) * kFramesPerPoint - kFramesPerPoint, pointAt(first));
    for (std::int64_t i = first; i < end; ++i) {
        const double start = static_cast<double>(i) * kFramesPerPoint;
        const double stop = std::min(start + kFramesPerPoint, static_cast<double>(waveform.frames));
        add((start + stop) / 2, pointAt(i));
    }
    add(static_cast<double>(end) * kFramesPerPoint + kFramesPerPoint, pointAt(end - 1));

    const MonotoneCurve lows(x, low), highs(x, high);
    std::vector<WaveformVertex> outline;
    const auto addVertex = [&](std::size_t i, double part) {
        outline.push_back({static_cast<float>(x[i] + (x[i + 1] - x[i]) * part), static_cast<float>(lows.at(i, part)),
                           static_cast<float>(highs.at(i, part))});
    };
    for (std::size_t i = 0; i + 1 < x.size(); ++i) {
        const double length = x[i + 1] - x[i];
        const double begin = std::clamp(-x[i] / length, 0.0, 1.0);
        const double stop = std::clamp((columns - x[i]) / length, 0.0, 1.0);
        if (begin >= stop)
            continue;
        const int pieces = std::max(1, static_cast<int>(std::ceil((stop - begin) * length / 2)));
        for (int piece = outline.empty() ? 0 : 1; piece <= pieces; ++piece)
            addVertex(i, begin + (stop - begin) * piece / pieces);
    }
    return outline;
}
