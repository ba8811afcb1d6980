// Shared by the coordination benchmarks: a file that is coordinated in a folder of its own, and a way to write it.
#pragma once

#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"

#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <mutex>
#include <string>

namespace coordinationbench {

using namespace platform;
using Clock = std::chrono::steady_clock;

/// A file and its own coordination folder, removed at the end.
class Place {
public:
    Place()
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        if (mkdtemp(pattern.data()) == nullptr)
            std::abort();
        folder_ = pattern;
        std::ofstream(file()) << "x";
        FileCoordinator::setCoordinationFolder(folder_ / "coordination");
    }
    ~Place()
    {
        FileCoordinator::setCoordinationFolder({});
        std::filesystem::remove_all(folder_);
    }
    std::string file() const { return folder_ / "song.wav"; }
    std::string other(const std::string& name) const { return folder_ / name; }
    URLRef url() const { return urlOf(file()); }
    static URLRef urlOf(const std::string& path)
    {
        return URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, false);
    }

private:
    std::filesystem::path folder_;
};

inline void write(const CoordinatedItem& item)
{
    FileCoordinator().coordinateWriting(item, FileCoordinator::WritingOptions::none, [](const URLRef&) {});
}

inline void read(const CoordinatedItem& item)
{
    FileCoordinator().coordinateReading(item, FileCoordinator::ReadingOptions::none, [](const URLRef&) {});
}

/// A signal from one thread to another, once.
class Signal {
public:
    void raise()
    {
        const std::lock_guard guard(mutex_);
        isRaised_ = true;
        changed_.notify_one();
    }
    void wait()
    {
        std::unique_lock guard(mutex_);
        changed_.wait(guard, [this] { return isRaised_; });
    }

private:
    std::mutex mutex_;
    std::condition_variable changed_;
    bool isRaised_ = false;
};

/// Retains, and waits for the handler.
template <class Lock>
void retainAndWait(Lock& lock)
{
    Signal held;
    lock.retainLockWithFinishedHandler([&] { held.raise(); });
    held.wait();
}

} // namespace coordinationbench
