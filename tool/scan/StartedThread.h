// Threads that a verb is quicker with, and does without where the system has no room for another (`ulimit -u`, `-v`).
#pragma once

#include <system_error>
#include <thread>
#include <utility>

/// A thread that runs `work`, which may take a stop token; not joinable when none could be started.
template <class Work>
std::jthread startedThread(Work&& work)
try {
    return std::jthread(std::forward<Work>(work));
} catch (const std::system_error&) {
    return {};
}
