// The progress of a scan on standard error: files done, their rate, and once their number is known the time left.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>

/// Shows itself after a second, on a terminal only, and is gone when it is destroyed.
class ScanProgress {
public:
    explicit ScanProgress(bool quiet);
    ScanProgress(const ScanProgress&) = delete;
    ScanProgress& operator=(const ScanProgress&) = delete;
    ~ScanProgress() { hide(); }

    /// Whether it will ever show, and so whether counting the files ahead is of use.
    bool isActive() const { return active_; }
    /// May be called from another thread.
    void setTotal(std::int64_t files) { total_ = files; }
    void advance(std::int64_t files);
    /// Clears its line, for other output to the same terminal.
    void hide();

private:
    using Clock = std::chrono::steady_clock;
    void draw(Clock::time_point now);

    bool active_;
    bool shown_ = false;
    std::atomic<std::int64_t> total_ = 0; // 0: not known yet
    std::int64_t done_ = 0;
    Clock::time_point start_ = Clock::now();
    Clock::time_point nextDraw_ = start_ + std::chrono::seconds(1);
};
