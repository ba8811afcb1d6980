#include "tool/project/ProjectBackup.h"

#include "files/FileCopy.h"
#include "platform/OwnedDescriptor.h"
#include "tool/project/ProjectEdit.h"
#include "tool/project/ProjectPackage.h"
#include "tool/project/UnfinishedBackup.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

#include <fmt/format.h>

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

constexpr const char* kBackedUp[] = {"ProjectData", "MetaData.plist", "ARA Files"};

[[noreturn]] void failWithErrno()
{
    throw Failure(SystemErrorText(errno));
}

void requireNoEnd()
{
    if (endIsWanted())
        throw Failure("interrupted");
}

/// Copies everything except an owner that this user may not set.
void keepAttributes(int from, platform::FileAttributes attributes, int to)
{
    platform::FileAttributes own;
    if (!platform::fileAttributes(to, own))
        failWithErrno();
    if (::geteuid() != 0 && (own.owner != attributes.owner || own.group != attributes.group)) {
        attributes.owner = own.owner;
        attributes.group = own.group;
        attributes.permissions &= ~std::uint32_t{S_ISUID | S_ISGID};
    }
    requireNone(CopyFileAttributes(from, attributes, to));
    synchronize(to);
}

/// Follows a link, because its target is what the backup is for.
void copyFile(const fs::path& from, const fs::path& to, bool quiet)
{
    const platform::OwnedDescriptor source(::open(from.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat status = {};
    platform::FileAttributes attributes;
    if (!source || ::fstat(source.get(), &status) != 0 || !platform::fileAttributes(source.get(), attributes))
        failWithErrno();
    if (!S_ISREG(status.st_mode))
        throw Failure(from.filename().string() + " is no regular file");
    const platform::OwnedDescriptor target(::open(to.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!target)
        failWithErrno();
    requireNone(CopyFileContent(source.get(), target.get(), copyProgress(from.filename().string(), quiet)));
    keepAttributes(source.get(), attributes, target.get());
    requireNoEnd();
}

void copyItem(const fs::path& from, const fs::path& to, bool quiet);

/// Sets the attributes last, so that the content of a read-only folder can be copied.
// NOLINTNEXTLINE(misc-no-recursion): no deeper than the folders are
void copyFolder(const fs::path& from, const fs::path& to, bool quiet)
{
    const platform::OwnedDescriptor source(::open(from.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    platform::FileAttributes attributes;
    if (!source || !platform::fileAttributes(source.get(), attributes) || ::mkdir(to.c_str(), 0700) != 0)
        failWithErrno();
    for (const fs::directory_entry& entry : fs::directory_iterator(from))
        copyItem(entry.path(), to / entry.path().filename(), quiet);
    const platform::OwnedDescriptor target(::open(to.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!target)
        failWithErrno();
    keepAttributes(source.get(), attributes, target.get());
}

// NOLINTNEXTLINE(misc-no-recursion)
void copyItem(const fs::path& from, const fs::path& to, bool quiet)
{
    const bool isLink = fs::is_symlink(fs::symlink_status(from));
    const fs::file_status leadsTo = fs::status(from);
    if (isLink && !fs::is_regular_file(leadsTo)) // a folder could be an enclosing one
        throw Failure(from.filename().string() + " is a link, and not to a file: a backup would hold the link alone");
    if (fs::is_directory(leadsTo))
        copyFolder(from, to, quiet);
    else
        copyFile(from, to, quiet);
}

void copyAlternative(const fs::path& alternative, const fs::path& unfinished, bool quiet)
{
    for (const char* name : kBackedUp) {
        const fs::path item = alternative / name;
        if (fs::symlink_status(item).type() == fs::file_type::not_found)
            continue;
        if (fs::is_symlink(fs::symlink_status(item)) && fs::is_directory(item))
            copyFolder(fs::canonical(item), unfinished / name, quiet);
        else
            copyItem(item, unfinished / name, quiet);
    }
}

/// The name that the backup took. Deletes old backups first only if no name is free.
platform::URLRef publish(UnfinishedBackup& unfinished, const platform::URLRef& package, long alternative, int keep)
{
    constexpr int kMostAttempts = 10; // others who do not coordinate may take the name
    for (int attempt = 0; attempt < kMostAttempts; ++attempt) {
        const auto name = [&](PurgeOldBackups purge) {
            return ProjectInformation::urlForNewBackupForBundleURL(package, alternative, CreateDirectories::no,
                                                                   kMostBackups, purge);
        };
        platform::URLRef backup = name(PurgeOldBackups::no);
        if (!backup && keep > 0)
            backup = name(PurgeOldBackups::yes);
        if (!backup)
            break;
        if (unfinished.publish(backup->posixPath()))
            return backup;
    }
    throw Failure("there is no room for another backup: --keep says how many there may be, the oldest go");
}

} // namespace

std::string makeBackup(const ProjectInformation& project, long alternative, int keep, bool dryRun, bool quiet)
{
    const platform::URLRef& package = project.projectURL();
    const auto folder = project.pathForVariant(alternative, AcceptMissing::no);
    if (!folder || !fs::exists(fs::path(*folder) / "ProjectData"))
        throw Failure("its alternative has no project data");
    if (ProjectInformation::interruptedExchangeForBundleURL(package, alternative))
        throw Failure("an exchange with a backup was cut short: project restore or project settle ends it");
    const auto backups = ProjectInformation::backupsBaseURLForBundleURL(package, alternative, CreateDirectories::no);
    requireNoLink(package->posixPath(), backups->posixPath());
    if (dryRun)
        return {};
    platform::URLRef backup;
    try {
        UnfinishedBackup unfinished(backups->posixPath());
        copyAlternative(*folder, unfinished.path(), quiet);
        backup = publish(unfinished, package, alternative, keep);
    } catch (const fs::filesystem_error& error) {
        throw Failure(SystemErrorText(error.code().value()));
    }
    if (keep > 0 && !ProjectInformation::purgeBackupsForBundleURL(package, alternative, keep, backup))
        throw Failure(fmt::format("backup {} was made, but not all old ones can be deleted: {}", backupName(backup),
                                  SystemErrorText(errno)));
    return backupName(backup);
}
