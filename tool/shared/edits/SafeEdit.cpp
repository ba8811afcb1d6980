#include "tool/shared/edits/SafeEdit.h"

#include "tool/shared/access/FileLock.h"
#include "tool/shared/edits/ChunkInventory.h"
#include "tool/shared/edits/FileCopy.h"
#include "tool/shared/edits/TemporaryFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <memory>
#include <optional>

namespace {

std::string resolvedPath(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> resolved(::realpath(path.c_str(), nullptr), &std::free);
    if (!resolved)
        throw Failure(systemErrorText(errno));
    return resolved.get();
}

bool sameTime(const timespec& a, const timespec& b)
{
    return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec;
}

std::string backupName(const std::string& target, int number)
{
    return number == 0 ? target + ".bak" : fmt::format("{}.bak.{}", target, number);
}

constexpr int kMostBackups = 10000;

FileAccess accessFor(const std::string& target, const EditOptions& options)
{
    using WritingOptions = platform::FileCoordinator::WritingOptions;
    return options.dryRun
               ? accessForReading(target, options.waiting())
               : accessForWriting(target, options.inPlace ? WritingOptions::none : WritingOptions::forReplacing,
                                  options.waiting());
}

} // namespace

SafeEdit::SafeEdit(const std::string& path, const EditOptions& options) : options_(options)
{
    requireRegularFile(path);
    target_ = resolvedPath(path);
    access_ = accessFor(target_, options_);
    // Whoever held the lock may have put a new file in the place of the one that was waited for.
    do {
        open();
        waitForOthers();
    } while (!isStillAtTarget());
    if (::fstat(file_.get(), &status_) != 0)
        throw Failure(systemErrorText(errno));
    requireOneName();
}

// What a run left that was killed between its backup and the end of its edit is one file under two names. An edit of a
// copy finishes that: the backup is the old content then.
void SafeEdit::requireOneName() const
{
    if (status_.st_nlink == 1)
        return;
    const std::string backup = ownBackup();
    if (options_.inPlace && !backup.empty())
        throw Failure(backup + " is the same file still, left so by an edit that was cut short, and would change with "
                               "it; an edit without --in-place keeps it as it is");
    if (!options_.inPlace && status_.st_nlink > (backup.empty() ? 1 : 2))
        throw Failure(fmt::format("has {} names (hard links), and the others would keep the old content; --in-place "
                                  "edits the file itself",
                                  status_.st_nlink));
}

bool SafeEdit::isOwnBackup(const std::string& name) const
{
    struct stat found = {};
    return ::lstat(name.c_str(), &found) == 0 && found.st_dev == status_.st_dev && found.st_ino == status_.st_ino;
}

std::string SafeEdit::ownBackup() const
{
    struct stat found = {};
    for (int number = 0; number < kMostBackups; ++number) {
        const std::string name = backupName(target_, number);
        if (isOwnBackup(name))
            return name;
        if (::lstat(name.c_str(), &found) != 0)
            break;
    }
    return "";
}

void SafeEdit::open()
{
    file_ = openRegularFile(target_, O_RDWR);
    if (!file_)
        throw Failure(errno == ENXIO ? "not a regular file" : systemErrorText(errno));
}

void SafeEdit::waitForOthers()
{
    // Without locks on this file system the check before the rename is what is left.
    waitForLock(file_.get(), target_, options_.waiting());
}

bool SafeEdit::isStillAtTarget() const
{
    struct stat opened = {}, named = {};
    if (::fstat(file_.get(), &opened) != 0 || ::stat(target_.c_str(), &named) != 0)
        throw Failure(systemErrorText(errno));
    return opened.st_dev == named.st_dev && opened.st_ino == named.st_ino;
}

void SafeEdit::requireUntouched(bool isAtTarget) const
{
    struct stat now = {};
    if (::fstat(file_.get(), &now) != 0)
        throw Failure(systemErrorText(errno));
    if (!isAtTarget || now.st_size != status_.st_size || !sameTime(now.st_mtim, status_.st_mtim) ||
        !sameTime(now.st_ctim, status_.st_ctim))
        throw Failure("was changed by another program meanwhile; nothing was done");
}

std::string SafeEdit::apply(const EditScope& scope, const Change& change)
{
    return options_.inPlace ? applyInPlace(scope, change) : applyToCopy(scope, change);
}

void SafeEdit::copyTo(TemporaryFile& copy) const
{
    Progress progress("copying", status_.st_size, options_.quiet);
    copyContent(file_.get(), copy.descriptor(), progress);
}

std::string SafeEdit::applyToCopy(const EditScope& scope, const Change& change)
{
    using Bodies = ChunkInventory::Bodies;
    TemporaryFile copy(target_);
    copyTo(copy);
    change(copy.path());
    if (scope.kind == EditScope::Kind::chunks) {
        requireUntouched(copy.targetIs(status_)); // else the copy would be blamed for what another program did
        ChunkInventory(file_.get(), scope, Bodies::whole)
            .requireSameIn(ChunkInventory(copy.descriptor(), scope, Bodies::whole));
    }
    copyAttributes(file_.get(), status_, copy.descriptor(), options_.keepTimes ? Times::kept : Times::now);
    synchronize(copy.descriptor());

    const SignalHold hold;
    requireUntouched(copy.targetIs(status_));
    const std::string backup = options_.backup ? backupByLink() : std::string();
    try {
        copy.replace();
    } catch (...) {
        if (!backup.empty())
            ::unlink(backup.c_str());
        throw;
    }
    if (!copy.synchronizeFolder())
        throw Failure("is edited, but a loss of power now may undo that: its folder cannot be committed to storage: " +
                      systemErrorText(errno));
    return backup;
}

// The change is not undone when it fails or is cut short, so that Ctrl-C must wait for its end. What it left behind the
// container would stand in the way of the next one.
std::string SafeEdit::applyInPlace(const EditScope& scope, const Change& change)
{
    using Bodies = ChunkInventory::Bodies;
    const std::string backup = options_.backup ? backupByCopy() : std::string();
    std::optional<ChunkInventory> before;
    if (scope.kind == EditScope::Kind::chunks)
        before.emplace(file_.get(), scope, Bodies::digests);
    const SignalHold hold;
    try {
        change(pathOfDescriptor(file_.get()));
    } catch (const Failure&) {
        if (before && before->end() == before->fileLength())
            cutBack(scope);
        throw;
    }
    if (before)
        before->requireSameIn(ChunkInventory(file_.get(), scope, Bodies::digests));
    if (options_.keepTimes) {
        const timespec stamps[2] = {status_.st_atim, status_.st_mtim};
        if (::futimens(file_.get(), stamps) != 0)
            throw Failure(systemErrorText(errno));
    }
    synchronize(file_.get());
    return backup;
}

void SafeEdit::cutBack(const EditScope& scope) const
{
    try {
        const ChunkInventory after(file_.get(), scope, ChunkInventory::Bodies::digests);
        if (after.end() < after.fileLength() && ::ftruncate(file_.get(), after.end()) == 0)
            synchronize(file_.get());
    } catch (const Failure&) { // what failed before is told
    }
}

std::string SafeEdit::backupByLink() const
{
    if (const std::string left = ownBackup(); !left.empty())
        return left;
    for (int number = 0; number < kMostBackups; ++number) {
        const std::string name = backupName(target_, number);
        if (::link(target_.c_str(), name.c_str()) == 0)
            return name;
        if (errno != EEXIST)
            return backupByCopy();
    }
    throw Failure("has too many backups");
}

std::string SafeEdit::backupByCopy() const
{
    TemporaryFile copy(target_);
    copyTo(copy);
    copyAttributes(file_.get(), status_, copy.descriptor(), Times::kept);
    synchronize(copy.descriptor());
    for (int number = 0; number < kMostBackups; ++number) {
        const std::string name = backupName(target_, number);
        if (!copy.publish(name))
            continue;
        if (!copy.synchronizeFolder())
            throw Failure("its backup cannot be committed to storage: " + systemErrorText(errno));
        return name;
    }
    throw Failure("has too many backups");
}
