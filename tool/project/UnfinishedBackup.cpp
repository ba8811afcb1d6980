#include "tool/project/UnfinishedBackup.h"

#include "platform/Folders.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <fcntl.h>
#include <random>
#include <sys/file.h>
#include <sys/stat.h>
#include <system_error>

namespace fs = std::filesystem;

namespace {

constexpr const char* kPrefix = ".ktfiles-backup";
constexpr int kMostAttempts = 100;

/// The folder, locked for this process; false if another process holds it, or it is no folder.
platform::OwnedDescriptor lockedFolder(const fs::path& path)
{
    platform::OwnedDescriptor folder(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    return folder && ::flock(folder.get(), LOCK_EX | LOCK_NB) == 0 ? std::move(folder) : platform::OwnedDescriptor();
}

void removeAbandoned(const fs::path& backups)
{
    std::error_code error;
    for (fs::directory_iterator entry(backups, error), end; !error && entry != end; entry.increment(error))
        if (entry->path().filename().string().starts_with(kPrefix))
            if (const platform::OwnedDescriptor lock = lockedFolder(entry->path()))
                platform::removeTree(entry->path().string());
}

} // namespace

UnfinishedBackup::UnfinishedBackup(const fs::path& backups)
{
    std::error_code error;
    fs::create_directories(backups, error);
    if (error)
        throw Failure(SystemErrorText(error.value()));
    removeAbandoned(backups);
    std::random_device random;
    for (int attempt = 0; attempt < kMostAttempts; ++attempt) {
        const fs::path path = backups / fmt::format("{}-{}-{:08x}", kPrefix, ::getpid(), random());
        if (::mkdir(path.c_str(), 0777) != 0) {
            if (errno == EEXIST)
                continue;
            throw Failure(SystemErrorText(errno));
        }
        lock_ = lockedFolder(path);
        struct stat status = {};
        // Another process may have locked the new folder first, taking it for an abandoned one.
        if (lock_ && ::fstat(lock_.get(), &status) == 0 && status.st_nlink > 0) {
            path_ = path;
            return;
        }
    }
    throw Failure("no folder can be made for the backup");
}

UnfinishedBackup::~UnfinishedBackup()
{
    if (!path_.empty())
        platform::removeTree(path_.string());
}

bool UnfinishedBackup::publish(const fs::path& name)
{
    synchronize(lock_.get());
    if (::rename(path_.c_str(), name.c_str()) != 0) {
        if (errno == EEXIST || errno == ENOTEMPTY || errno == ENOTDIR)
            return false;
        throw Failure(SystemErrorText(errno));
    }
    path_.clear();
    synchronizeFolderOf(name.string());
    return true;
}
