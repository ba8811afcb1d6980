// Points in time as people write them: "1:02:03.456".
#pragma once

#include <optional>
#include <string>

enum class ShowHours { whenAny, always };

/// Minutes and seconds with `decimals` digits behind the point, and hours.
std::string clockText(double seconds, int decimals, ShowHours showHours = ShowHours::whenAny);

/// A duration to the millisecond; hours where there are any.
std::string durationText(double seconds);

/// Seconds from "12.5", "1:02.5" or "1:02:03.5"; none for what is no time.
std::optional<double> timeFromText(const std::string& text);
