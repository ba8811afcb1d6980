// A progress bar on standard error, for work that lasts.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <string>

/// Shows itself after a second, on a terminal only, and is gone when it is destroyed.
class Progress {
public:
    /// `total` bytes of work; `label` says which.
    Progress(std::string label, std::int64_t total, bool quiet);
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;
    ~Progress();

    void advance(std::int64_t bytes);

private:
    using Clock = std::chrono::steady_clock;
    void draw() const;

    std::string label_;
    std::int64_t total_;
    std::int64_t done_ = 0;
    bool active_;
    bool shown_ = false;
    Clock::time_point nextDraw_;
};

/// A bar for each copy that the library tells of, which is gone when the copy is made.
std::function<void(std::int64_t done, std::int64_t all)> copyProgress(std::string label, bool quiet);
