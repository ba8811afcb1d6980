// The ticks of a time axis: round times, far enough apart for their labels.
#pragma once

#include <string>
#include <vector>

struct TimeTick {
    double seconds;
    std::string label; // empty: a small tick between labelled ones
};

/// The ticks from `start` to `end` (in seconds, start before end) along `width` pixels. Labels are clock times, or
/// milliseconds if the axis ends within its first second and whole seconds are too far apart.
std::vector<TimeTick> timeTicks(double start, double end, double width);
