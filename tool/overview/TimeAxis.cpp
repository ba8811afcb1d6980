#include "tool/overview/TimeAxis.h"

#include "tool/shared/output/ClockTime.h"

#include <fmt/format.h>

#include <array>
#include <cmath>
#include <cstdint>

namespace {

struct Step {
    double seconds;
    int divisions; // by small ticks
};

constexpr std::array kClockSteps{Step{1, 5},     Step{2, 4},     Step{5, 5},    Step{10, 5},   Step{15, 3},
                                 Step{30, 3},    Step{60, 4},    Step{120, 4},  Step{300, 5},  Step{600, 5},
                                 Step{900, 3},   Step{1800, 3},  Step{3600, 4}, Step{7200, 4}, Step{10800, 3},
                                 Step{21600, 6}, Step{43200, 4}, Step{86400, 4}};
constexpr std::array kDecimalSteps{Step{1, 5}, Step{2, 4}, Step{5, 5}};

constexpr double kSmallestStep = 1e-7;
constexpr double kCharacterWidth = 7;
constexpr double kGapBetweenLabels = 44;
constexpr double kGapBetweenSmallTicks = 5;

int decimalsOf(double step)
{
    return std::max(0, static_cast<int>(std::ceil(-std::log10(step) - 1e-9)));
}

std::string labelAt(double seconds, double step, double end)
{
    if (step < 1 && end <= 1)
        return fmt::format("{:.{}f} ms", seconds * 1000, decimalsOf(step * 1000));
    constexpr double kHour = 3600;
    return clockText(seconds, decimalsOf(step), end >= kHour ? ShowHours::always : ShowHours::whenAny);
}

bool hasRoom(double step, double end, double pixelsPerSecond)
{
    const double label = kCharacterWidth * static_cast<double>(labelAt(end, step, end).size());
    return step * pixelsPerSecond >= label + kGapBetweenLabels;
}

Step stepFor(double end, double pixelsPerSecond)
{
    for (double decade = kSmallestStep; decade < 0.5; decade *= 10)
        for (const Step& step : kDecimalSteps)
            if (hasRoom(step.seconds * decade, end, pixelsPerSecond))
                return {step.seconds * decade, step.divisions};
    for (const Step& step : kClockSteps)
        if (hasRoom(step.seconds, end, pixelsPerSecond))
            return step;
    Step days = kClockSteps.back();
    while (!hasRoom(days.seconds, end, pixelsPerSecond))
        days.seconds *= 2;
    return days;
}

} // namespace

std::vector<TimeTick> timeTicks(double start, double end, double width)
{
    const double pixelsPerSecond = width / (end - start);
    Step step = stepFor(end, pixelsPerSecond);
    if (step.seconds / step.divisions * pixelsPerSecond < kGapBetweenSmallTicks)
        step.divisions = 1;
    const double small = step.seconds / step.divisions;
    constexpr double kSlack = 1e-6; // of a step, so that rounding does not lose a tick at the very end
    const auto first = static_cast<std::int64_t>(std::ceil(start / small - kSlack));
    const auto last = static_cast<std::int64_t>(std::floor(end / small + kSlack));
    std::vector<TimeTick> ticks;
    for (std::int64_t i = first; i <= last; ++i) {
        const double seconds = static_cast<double>(i) * small;
        ticks.push_back({seconds, i % step.divisions == 0 ? labelAt(seconds, step.seconds, end) : std::string()});
    }
    return ticks;
}
