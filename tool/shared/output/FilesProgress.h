// The progress of work on files, on standard error: what is done, how many of how many, the time left, and which file
// is worked on.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <mutex>
#include <string>

/// Shows itself after a second, on a terminal only, and is gone when it is destroyed. Any thread may tell it anything.
class FilesProgress {
public:
    /// `doing` says what is done: "scanning".
    FilesProgress(std::string doing, bool quiet);
    FilesProgress(const FilesProgress&) = delete;
    FilesProgress& operator=(const FilesProgress&) = delete;
    ~FilesProgress();

    /// Whether it will ever show, and so whether counting the files ahead is of use.
    bool isActive() const { return active_; }
    /// One file is told of by the part that is done of it, not by its number.
    void setTotal(std::int64_t files) { total_ = files; }
    /// Ahead of the work on a file.
    void begin(const std::string& path);
    /// What this thread added as parts since it last asked, which `advance` makes whole files of.
    static double takeParts();
    void advance(std::int64_t files, double parts = 0);

private:
    friend class Progress;
    using Clock = std::chrono::steady_clock;

    static FilesProgress* current();
    void addPart(double part);
    void draw();
    std::string text(int columns);

    std::string doing_;
    bool active_;
    std::atomic<std::int64_t> total_ = 0; // 0: not known yet
    std::atomic<std::int64_t> done_ = 0;
    std::atomic<double> parts_ = 0; // of the files that are worked on
    std::mutex nameMutex_;
    std::string name_;
    Clock::time_point start_ = Clock::now();
};
