#include "FileAccess.h"

#include "Failure.h"
#include "Parties.h"
#include "Terminal.h"

#include <fmt/core.h>

#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <filesystem>
#include <mutex>
#include <system_error>
#include <thread>
#include <unistd.h>

using platform::FileCoordinator;

namespace {

/// Says what is waited for when that lasts longer than a second. Its thread ends with it: threads that stayed would
/// take the signals that an edit holds back.
class WaitNotice {
public:
    WaitNotice(const std::string& path, const platform::CoordinatedItem& item, bool isWriting)
        : thread_([this, &path, &item, isWriting](const std::stop_token& stop) {
              std::unique_lock lock(mutex_);
              ended_.wait_for(lock, stop, std::chrono::seconds(1), [] { return false; });
              if (!stop.stop_requested())
                  printWaiting(path, item, isWriting);
          })
    {
    }

private:
    std::mutex mutex_;
    std::condition_variable_any ended_;
    std::jthread thread_; // the last: it uses the others
};

std::unique_ptr<WaitNotice> noticeOf(const std::string& path, const platform::CoordinatedItem& item, bool isWriting,
                                     bool quiet)
{
    if (quiet || !isTerminal(STDERR_FILENO))
        return nullptr;
    try {
        return std::make_unique<WaitNotice>(path, item, isWriting);
    } catch (const std::system_error&) { // no thread: the wait is not told
        return nullptr;
    }
}

} // namespace

platform::URLRef coordinatedURL(const std::string& path)
{
    std::error_code error;
    const std::filesystem::path absolute = std::filesystem::absolute(path, error);
    if (error)
        throw Failure(systemErrorText(error.value()));
    const auto text = platform::String::fromFileSystemRepresentation(absolute.c_str());
    auto url = platform::URL::createWithFileSystemPath(text, platform::PathStyle::posix, false);
    if (!url)
        throw Failure("its path is not valid UTF-8");
    return url;
}

FileAccess accessForReading(const std::string& path, bool quiet)
{
    const platform::CoordinatedItem item(coordinatedURL(path));
    if (lockAbove(item))
        return nullptr;
    const auto notice = noticeOf(path, item, false, quiet);
    return FileCoordinator().openForReading(item, FileCoordinator::ReadingOptions::none);
}

FileAccess accessForWriting(const std::string& path, FileCoordinator::WritingOptions options, bool quiet)
{
    const platform::CoordinatedItem item(coordinatedURL(path));
    if (const auto lock = lockAbove(item)) {
        if (lock->isWriting)
            return nullptr;
        throw Failure(
            fmt::format("is locked for reading by process {}, which waits for this command", lock->processID));
    }
    const auto notice = noticeOf(path, item, true, quiet);
    platform::Error error;
    auto access = FileCoordinator().openForWriting(item, options, &error);
    if (!access)
        throw Failure("other programs cannot be held back from it: " + error.description);
    return access;
}

void printWaiting(const std::string& path, const platform::CoordinatedItem& item, bool isWriting)
{
    fmt::print(stderr, "ktfiles: {}: waiting for {} ...\n", printable(path), blockersText(item, isWriting));
}
