#include "ProjectBackup.h"

#include "Descriptor.h"
#include "Failure.h"
#include "FileCopy.h"
#include "Progress.h"
#include "ProjectEdit.h"
#include "ProjectPackage.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>

namespace fs = std::filesystem;

namespace {

constexpr const char* kBackedUp[] = {"ProjectData", "MetaData.plist", "ARA Files"};
/// Hidden, so that a backup of which half is there is none. Edits of a package wait for each other: one that is there
/// was left by a process that was killed.
constexpr const char* kUnfinished = ".ktfiles-backup";

[[noreturn]] void failWithErrno()
{
    throw Failure(systemErrorText(errno));
}

void requireNoEnd()
{
    if (endIsWanted())
        throw Failure("interrupted");
}

void copyFile(const fs::path& from, const fs::path& to, bool quiet)
{
    const Descriptor source(::open(from.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    struct stat status = {};
    if (!source || ::fstat(source.get(), &status) != 0)
        failWithErrno();
    if (!S_ISREG(status.st_mode))
        throw Failure(from.filename().string() + " is no regular file");
    const Descriptor target(::open(to.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!target)
        failWithErrno();
    Progress progress(from.filename().string(), status.st_size, quiet);
    copyContent(source.get(), target.get(), progress);
    copyAttributes(source.get(), status, target.get());
    synchronize(target.get());
    requireNoEnd();
}

// NOLINTNEXTLINE(misc-no-recursion): no deeper than the folders are
void copyItem(const fs::path& from, const fs::path& to, bool quiet)
{
    const fs::file_status status = fs::symlink_status(from);
    if (fs::is_symlink(status)) {
        fs::copy_symlink(from, to);
    } else if (fs::is_directory(status)) {
        fs::create_directory(to, from);
        for (const fs::directory_entry& entry : fs::directory_iterator(from))
            copyItem(entry.path(), to / entry.path().filename(), quiet);
    } else {
        copyFile(from, to, quiet);
    }
}

void copyAlternative(const fs::path& alternative, const fs::path& unfinished, bool quiet)
{
    fs::create_directories(unfinished.parent_path());
    fs::remove_all(unfinished);
    fs::create_directory(unfinished);
    for (const char* item : kBackedUp)
        if (fs::symlink_status(alternative / item).type() != fs::file_type::not_found)
            copyItem(alternative / item, unfinished / item, quiet);
}

/// Old backups go only when the new one is whole.
std::string publish(const fs::path& unfinished, const platform::URLRef& package, long alternative, int keep,
                    PurgeOldBackups purge)
{
    const platform::URLRef backup =
        ProjectInformation::urlForNewBackupForBundleURL(package, alternative, CreateDirectories::no, keep, purge);
    if (!backup)
        throw Failure("there is no room for another backup: --keep says how many there may be, the oldest go");
    fs::rename(unfinished, backup->posixPath()); // over an empty folder at most
    synchronizeFolderOf(backup->posixPath().c_str());
    return backupName(backup);
}

} // namespace

std::string makeBackup(const ProjectInformation& project, long alternative, int keep, PurgeOldBackups purge,
                       bool dryRun, bool quiet)
{
    const platform::URLRef& package = project.projectURL();
    const auto folder = project.pathForVariant(alternative, AcceptMissing::no);
    if (!folder || !fs::exists(fs::path(*folder) / "ProjectData"))
        throw Failure("its alternative has no project data");
    if (ProjectInformation::interruptedExchangeForBundleURL(package, alternative))
        throw Failure("an exchange with a backup was cut short: restore settles it");
    if (dryRun)
        return {};
    const auto backups = ProjectInformation::backupsBaseURLForBundleURL(package, alternative, CreateDirectories::no);
    const fs::path unfinished = fs::path(backups->posixPath()) / kUnfinished;
    try {
        copyAlternative(*folder, unfinished, quiet);
        return publish(unfinished, package, alternative, keep, purge);
    } catch (const fs::filesystem_error& error) {
        std::error_code ignored;
        fs::remove_all(unfinished, ignored);
        throw Failure(systemErrorText(error.code().value()));
    } catch (...) {
        std::error_code ignored;
        fs::remove_all(unfinished, ignored);
        throw;
    }
}
