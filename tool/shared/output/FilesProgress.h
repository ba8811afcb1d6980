// The progress of work on many files, on standard error: files done, their rate, and once their number is known the
// time left.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <string>

/// Shows itself after a second, on a terminal only, and is gone when it is destroyed.
class FilesProgress {
public:
    /// `label` says what is done: "scanning".
    FilesProgress(std::string label, bool quiet);
    FilesProgress(const FilesProgress&) = delete;
    FilesProgress& operator=(const FilesProgress&) = delete;
    ~FilesProgress() { hide(); }

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

    std::string label_;
    bool active_;
    bool shown_ = false;
    std::atomic<std::int64_t> total_ = 0; // 0: not known yet
    std::int64_t done_ = 0;
    Clock::time_point start_ = Clock::now();
    Clock::time_point nextDraw_ = start_ + std::chrono::seconds(1);
};
