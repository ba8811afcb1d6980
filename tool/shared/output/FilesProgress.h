// Progress of work on files, on standard error: how many of how many are done, the time left, and the current file.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <mutex>
#include <string>

/// Appears after a second, on a terminal only, and disappears on destruction. May be updated by any thread.
class FilesProgress {
public:
    /// `doing` names the work: "scanning".
    FilesProgress(std::string doing, bool quiet);
    FilesProgress(const FilesProgress&) = delete;
    FilesProgress& operator=(const FilesProgress&) = delete;
    ~FilesProgress();

    /// Whether it will ever appear, so that counting the files in advance is useful.
    bool isActive() const { return active_; }
    /// Progress within a single file is shown by the part done.
    void setTotal(std::int64_t files) { total_ = files; }
    /// Call before the work on a file.
    void begin(const std::string& path);
    /// The parts added by this thread since the last call, which `advance` turns into whole files.
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
    std::atomic<std::int64_t> total_ = 0; // 0 if not known yet
    std::atomic<std::int64_t> done_ = 0;
    std::atomic<double> parts_ = 0; // of files in progress
    std::mutex nameMutex_;
    std::string name_;
    Clock::time_point start_ = Clock::now();
};
