// Threads that a verb is quicker with, and does without where the system has no room for another (`ulimit -u`, `-v`).
#pragma once

#include "platform/SignalHold.h"

#include <system_error>
#include <thread>
#include <utility>

/// A thread that runs `work`, which may take a stop token; not joinable when none could be started. Signals that end
/// the process are left to the thread that started it, which knows when they may come.
template <class Work>
std::jthread startedThread(Work&& work)
try {
    const platform::SignalHold inherited;
    return std::jthread(std::forward<Work>(work));
} catch (const std::system_error&) {
    return {};
}
