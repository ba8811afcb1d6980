// Clocks of the benchmarks.
#pragma once

#include <algorithm>
#include <chrono>
#include <vector>

#include <sys/resource.h>
#include <time.h>

/// Wall-clock seconds of the work.
double seconds(const auto& work)
{
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

inline double secondsOn(clockid_t clock)
{
    timespec now{};
    clock_gettime(clock, &now);
    return static_cast<double>(now.tv_sec) + 1e-9 * static_cast<double>(now.tv_nsec);
}

/// Processor seconds of the work in all threads of the process.
double processorSeconds(const auto& work)
{
    const double start = secondsOn(CLOCK_PROCESS_CPUTIME_ID);
    work();
    return secondsOn(CLOCK_PROCESS_CPUTIME_ID) - start;
}

/// Processor seconds of all children that have ended.
inline double processorSecondsOfChildren()
{
    rusage used{};
    getrusage(RUSAGE_CHILDREN, &used);
    const auto inSeconds = [](const timeval& time) {
        return static_cast<double>(time.tv_sec) + 1e-6 * static_cast<double>(time.tv_usec);
    };
    return inSeconds(used.ru_utime) + inSeconds(used.ru_stime);
}

/// Of an even number of values, the upper middle one.
inline double median(std::vector<double> values)
{
    std::ranges::nth_element(values, values.begin() + std::ssize(values) / 2);
    return values[values.size() / 2];
}
