#include "tool/index/FolderWatch.h"

#include "tool/shared/indexing/StorageKind.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/output/Failure.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <poll.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

// A copy of many files is taken in few steps, and is not waited for to its end.
constexpr std::chrono::milliseconds kQuiet{300}, kLongestUnquiet{3'000};
constexpr std::uint32_t kWatchedEvents = IN_CLOSE_WRITE | IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO |
                                         IN_ATTRIB | IN_DELETE_SELF | IN_MOVE_SELF | IN_ONLYDIR | IN_EXCL_UNLINK;

// A file that is being written announces its end. Further names of files that are there, and links, do not.
bool isBeingWritten(const std::string& path)
{
    struct stat status = {};
    return ::lstat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode) && status.st_nlink == 1;
}

} // namespace

FolderWatch::FolderWatch(const std::string& database) : queue_(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC))
{
    if (!queue_)
        throw Failure("folders cannot be watched: " + SystemErrorText(errno));
    std::error_code error;
    const std::filesystem::path path = std::filesystem::weakly_canonical(database, error);
    databaseFolder_ = path.parent_path().string() + "/";
    databaseName_ = path.filename().string();
}

void FolderWatch::add(const FolderListing& folder)
{
    const int watch = ::inotify_add_watch(queue_.get(), folder.path.c_str(), kWatchedEvents);
    const int error = errno;
    const bool isSilent = isOnNetwork(folder.path);
    const std::lock_guard lock(mutex_);
    if (watch >= 0)
        watched_[watch] = {folder.path, folder.words, folder.rootLength};
    isLimitReached_ = isLimitReached_ || (watch < 0 && (error == ENOSPC || error == ENOMEM) && !missesSome_);
    missesSome_ = missesSome_ || watch < 0 || isSilent;
}

bool FolderWatch::takeLimitReached()
{
    return std::exchange(isLimitReached_, false);
}

FolderWatch::Changes FolderWatch::wait(std::chrono::milliseconds longest)
{
    using Clock = std::chrono::steady_clock;
    Changes changes;
    if (!readEvents(longest))
        return changes;
    for (const auto end = Clock::now() + kLongestUnquiet; Clock::now() < end && readEvents(kQuiet);) {
    }
    for (const ChangedFolder& folder : std::exchange(changed_, {}))
        changes.folders.push_back(folder);
    changes.areUnknown = std::exchange(areUnknown_, false);
    // What is gone through with all that is below it is not listed alone before.
    const std::vector<ChangedFolder> all = changes.folders;
    std::erase_if(changes.folders, [&](const ChangedFolder& folder) {
        return !folder.isWhole && std::ranges::any_of(all, [&](const ChangedFolder& other) {
            return other.isWhole && folder.path.starts_with(other.path);
        });
    });
    return changes;
}

bool FolderWatch::readEvents(std::chrono::milliseconds longest)
{
    pollfd waiting{queue_.get(), POLLIN, 0};
    if (::poll(&waiting, 1, static_cast<int>(longest.count())) <= 0)
        return false;
    alignas(inotify_event) std::array<char, 1 << 16> bytes;
    bool isRelevant = false;
    for (;;) {
        const ssize_t got = ::read(queue_.get(), bytes.data(), bytes.size());
        if (got <= 0)
            break;
        for (ssize_t at = 0; at < got;) {
            inotify_event event;
            std::memcpy(&event, bytes.data() + at, sizeof event);
            const char* const name = bytes.data() + at + sizeof event;
            note(event.wd, event.mask, event.len > 0 ? std::string(name) : std::string());
            at += static_cast<ssize_t>(sizeof event + event.len);
        }
        isRelevant = !changed_.empty() || areUnknown_;
    }
    return isRelevant;
}

void FolderWatch::note(int watch, std::uint32_t mask, const std::string& name)
{
    if ((mask & IN_Q_OVERFLOW) != 0) {
        areUnknown_ = true;
        return;
    }
    const std::lock_guard lock(mutex_);
    const auto found = watched_.find(watch);
    if (found == watched_.end())
        return;
    const Watched folder = found->second;
    if ((mask & (IN_IGNORED | IN_UNMOUNT)) != 0)
        watched_.erase(found);
    if ((mask & (IN_DELETE_SELF | IN_MOVE_SELF | IN_UNMOUNT)) != 0 &&
        ((mask & IN_UNMOUNT) != 0 || folder.words.size() == folder.rootLength))
        areUnknown_ = true;
    if (name.empty() || name.starts_with('.') || isDatabase(folder, name))
        return;
    if ((mask & IN_ISDIR) != 0)
        noteFolder(folder, name, mask);
    else if ((mask & IN_CREATE) == 0 || !isBeingWritten(folder.path + name))
        changed_.insert({folder.path, folder.words, folder.rootLength, isFolder(folder.path + name)}); // by a link
}

void FolderWatch::noteFolder(const Watched& parent, const std::string& name, std::uint32_t mask)
{
    if ((mask & (IN_MOVED_FROM | IN_DELETE)) != 0)
        forgetBelow(parent.path + name + "/");
    changed_.insert({parent.path + name + "/", parent.words + name + "/", parent.rootLength, true});
}

// A folder that moves takes its watches with it, under names that are not its own any more.
void FolderWatch::forgetBelow(const std::string& path)
{
    for (auto watch = watched_.begin(); watch != watched_.end();)
        if (watch->second.path.starts_with(path)) {
            ::inotify_rm_watch(queue_.get(), watch->first);
            watch = watched_.erase(watch);
        } else {
            ++watch;
        }
}

bool FolderWatch::isDatabase(const Watched& folder, const std::string& name) const
{
    return folder.path == databaseFolder_ && name.starts_with(databaseName_);
}
