// Waits for others, reports it if that takes long, and gives up after a timeout.
#pragma once

#include <functional>
#include <optional>
#include <string>

struct WaitOptions {
    /// How long to wait for others each time they are in the way: 0 or more. Unlimited if not set.
    std::optional<double> timeoutSeconds = std::nullopt;
    bool quiet = false; // does not report a wait of more than a second
};

/// Returns when `wait`, which may block, has returned; throws what it throws. After a second it reports on standard
/// error what is waited for; `blockers` describes it: "process 12 (bounce)". Throws Failure on a timeout. `wait` runs
/// on another thread and then continues there, so it must own what it uses, and release what it acquires too late.
void awaitOthers(const std::string& path, const WaitOptions& options, const std::function<std::string()>& blockers,
                 std::function<void()> wait);

/// Prints "ktfiles: FILE: waiting for process 12 (bounce) ..." on standard error.
void printWaiting(const std::string& path, const std::string& blockers);

/// The text of a Failure: what the access still waits for after that time.
std::string stillInUseText(const std::string& blockers, double seconds);

/// Shortest wait in seconds: even a free item takes a moment if a presenter must answer.
inline constexpr double kShortestWait = 0.1;
