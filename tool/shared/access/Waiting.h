// How the command waits for others: it says so when that lasts, and gives up when it was told to.
#pragma once

#include <functional>
#include <optional>
#include <string>

struct WaitOptions {
    /// For how long others are waited for, each time that they are in the way: 0 or more. Without it there is no limit.
    std::optional<double> timeoutSeconds = std::nullopt;
    bool quiet = false; // whether a wait of more than a second is kept from standard error
};

/// Comes back when `wait`, which may block, has done so; throws what it throws. After a second it says on standard
/// error what is waited for: `blockers` gives the words, "process 12 (bounce)". Throws Failure when the time is up.
/// `wait` runs on another thread and then goes on there: it owns what it uses, and must give back what it gets too
/// late.
void awaitOthers(const std::string& path, const WaitOptions& options, const std::function<std::string()>& blockers,
                 std::function<void()> wait);

/// "ktfiles: FILE: waiting for process 12 (bounce) ...", on standard error.
void printWaiting(const std::string& path, const std::string& blockers);

/// The words of a Failure: what an access that was waited for in vain still waits for.
std::string stillInUseText(const std::string& blockers, double seconds);

/// Even what is free takes a moment to be had, from a presenter that has to answer: no wait is shorter, in seconds.
inline constexpr double kShortestWait = 0.1;
