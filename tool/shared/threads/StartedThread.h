// Threads that make a verb faster, and that it can do without if the system has no room for more (`ulimit -u`, `-v`).
#pragma once

#include "platform/SignalHold.h"

#include <system_error>
#include <thread>
#include <utility>

/// A thread that runs `work`, which may take a stop token; not joinable if none could be started. Signals that end the
/// process go to the starting thread, which knows when they may arrive.
template <class Work>
std::jthread startedThread(Work&& work)
try {
    const platform::SignalHold inherited;
    return std::jthread(std::forward<Work>(work));
} catch (const std::system_error&) {
    return {};
}
