#include "tool/overview/LevelScale.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>

namespace {

constexpr float kLeastDistance = 14; // between labels
constexpr int kStep = 6;             // decibels

// Decibels of full scale, to a tenth unless there are three digits.
std::string labelOf(double decibels)
{
    const double shown = std::abs(decibels) < 99.95 ? std::round(decibels * 10) / 10 : std::round(decibels);
    if (shown == 0)
        return "0";
    const char* const sign = shown < 0 ? "\u2212" : "+";
    return fmt::format("{}{:.{}f}", sign, std::abs(shown), shown == std::round(shown) ? 0 : 1);
}

} // namespace

LevelScale::LevelScale(float top, float bottom, double gain)
    : top_(top),
      bottom_(bottom),
      centre_((top + bottom) / 2),
      reach_((bottom - top) / 2 - std::clamp((bottom - top) * 0.05F, 0.5F, 12.0F)),
      gain_(gain),
      factor_(static_cast<float>(std::pow(10, gain / 20)))
{
}

std::vector<Level> LevelScale::levels() const
{
    std::vector<Level> above, below;
    const auto add = [&](double decibels) {
        const float sample = static_cast<float>(std::pow(10, decibels / 20));
        above.push_back({y(sample), labelOf(decibels)});
        below.push_back({y(-sample), labelOf(decibels)});
    };
    const double highest = -gain_;
    if (reach_ >= kLeastDistance)
        add(highest);
    float taken = reach_;
    for (double decibels = std::ceil(highest / kStep - 1) * kStep;; decibels -= kStep) {
        const float height = reach_ * static_cast<float>(std::pow(10, (decibels - highest) / 20));
        if (height < kLeastDistance)
            break;
        if (taken - height < kLeastDistance)
            continue;
        taken = height;
        add(decibels);
    }
    above.push_back({centre_, "\u2212\u221E"});
    above.insert(above.end(), below.rbegin(), below.rend());
    return above;
}
