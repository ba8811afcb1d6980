#include "files/CSafeEdit.h"

#include "files/CTemporaryFile.h"
#include "platform/FileLock.h"
#include "platform/SignalHold.h"
#include "platform/core/Status.h"

#include <cerrno>
#include <filesystem>

using platform::FileStatus;
using platform::systemCalls;
using Kind = FileProblem::Kind;

namespace {

std::string backupName(const std::string& target, int number)
{
    return number == 0 ? target + ".bak" : target + ".bak." + std::to_string(number);
}

constexpr int kMostBackups = 10000;

FileProblem refusedBy(std::int32_t status)
{
    return status == kStatusOK ? FileProblem() : FileProblem{.kind = Kind::refused, .status = status};
}

} // namespace

std::int32_t CSafeEdit::LookBefore(int)
{
    return kStatusOK;
}

std::int32_t CSafeEdit::LookAfter(int, int)
{
    return kStatusOK;
}

void CSafeEdit::CutBack(int)
{
}

FileProblem CSafeEdit::Begin(const std::string& path, SafeEditOptions options)
{
    options_ = std::move(options);
    std::error_code error;
    target_ = std::filesystem::canonical(path, error).string();
    if (error)
        return {Kind::system, error.value()};
    // The holder of the lock may have put a new file at the path of the one that was waited for.
    for (bool isAtTarget = false; !isAtTarget;) {
        if (FileProblem problem = open())
            return problem;
        if (FileProblem problem = waitForOthers())
            return problem;
        FileStatus named;
        if (!systemCalls().status(file_.get(), &status_) || !systemCalls().pathStatus(target_.c_str(), &named))
            return FileProblem::ofSystem();
        isAtTarget = status_.isSameItem(named);
    }
    if (!platform::fileAttributes(file_.get(), attributes_))
        return FileProblem::ofSystem();
    return requireOneName();
}

// A process that was killed between its backup and the end of its edit leaves one file under two names. An edit of a
// copy completes that: the backup then holds the old content.
FileProblem CSafeEdit::requireOneName() const
{
    if (status_.links == 1)
        return {};
    const std::string backup = ownBackup();
    if (options_.inPlace && !backup.empty())
        return {.kind = Kind::sameAsBackup, .name = backup};
    if (!options_.inPlace && status_.links > (backup.empty() ? 1 : 2))
        return {.kind = Kind::hardLinks, .count = status_.links};
    return {};
}

bool CSafeEdit::isOwnBackup(const std::string& name) const
{
    FileStatus found;
    return systemCalls().linkStatus(name.c_str(), &found) && found.isSameItem(status_);
}

std::string CSafeEdit::ownBackup() const
{
    FileStatus found;
    if (status_.links == 1) // saves looking at every backup
        return "";
    for (int number = 0; number < kMostBackups; ++number) {
        std::string name = backupName(target_, number);
        if (isOwnBackup(name))
            return name;
        if (!systemCalls().linkStatus(name.c_str(), &found))
            break;
    }
    return "";
}

FileProblem CSafeEdit::open()
{
    file_ = platform::OwnedDescriptor(
        systemCalls().openFile(target_.c_str(), platform::OpenFor::readingAndWriting, nullptr));
    return file_ ? FileProblem() : FileProblem::ofSystem();
}

// On a file system without locks, the check ahead of the rename is the only protection.
FileProblem CSafeEdit::waitForOthers()
{
    if (platform::tryToLockFile(file_.get()) != platform::FileLockResult::busy)
        return {};
    if (options_.waitForLock)
        return refusedBy(options_.waitForLock(file_.get(), target_));
    platform::waitToLockFile(file_.get());
    return {};
}

FileProblem CSafeEdit::requireUntouched(const CTemporaryFile& copy) const
{
    FileStatus now;
    if (!systemCalls().status(file_.get(), &now))
        return FileProblem::ofSystem();
    if (!copy.TargetIs(status_) || now.size != status_.size || now.changed != status_.changed)
        return {Kind::changed};
    return {};
}

FileProblem CSafeEdit::Apply(const Change& change)
{
    backup_.clear();
    return options_.inPlace ? applyInPlace(change) : applyToCopy(change);
}

FileProblem CSafeEdit::copyTo(CTemporaryFile& copy) const
{
    if (FileProblem problem = copy.Create(target_))
        return problem;
    return CopyFileContent(file_.get(), copy.Descriptor(), options_.progress);
}

// Changes a copy that then takes the original's place. What is on disk after each step:
//
// 1. Create: an empty file ".NAME.ktfiles-N" in the same folder, locked by this process.
// 2. The content, the change, and the attributes of the original, all in the copy; Commit flushes it.
// 3. With a backup: the original under a second name as well, NAME.bak.
// 4. Replace: NAME leads to the copy, in one rename.
// 5. CommitFolder: the rename survives a power failure.
//
// Readers of NAME find the whole old file before 4 and the whole new one after it; those that have it open keep the old
// one. Ctrl-C and other signals remove the copy up to 3 and wait from there on. A process that is killed before 3
// leaves the copy, which the next edit of the file removes because nobody holds its lock; between 3 and 4 it also
// leaves one file under two names, which the next edit completes (requireOneName). A power failure between 4 and 5 may
// bring back the old file, whole.
FileProblem CSafeEdit::applyToCopy(const Change& change)
{
    const KeptTimes times = options_.keepTimes ? KeptTimes::all : KeptTimes::accessOnly;
    CTemporaryFile copy;
    if (FileProblem problem = copyTo(copy))
        return problem;
    if (FileProblem problem = refusedBy(change(copy.Path())))
        return problem;
    // Otherwise the copy would be blamed for what another program did.
    if (FileProblem problem = requireUntouched(copy))
        return problem;
    if (FileProblem problem = refusedBy(LookAfter(file_.get(), copy.Descriptor())))
        return problem;
    if (FileProblem problem = CopyFileAttributes(file_.get(), attributes_, copy.Descriptor(), times))
        return problem;
    if (FileProblem problem = copy.Commit())
        return problem;

    const platform::SignalHold hold;
    if (FileProblem problem = requireUntouched(copy))
        return problem;
    if (FileProblem problem = options_.backup ? backupByLink() : FileProblem())
        return problem;
    if (FileProblem problem = copy.Replace()) {
        if (!backup_.empty())
            systemCalls().removeFile(backup_.c_str());
        backup_.clear();
        return problem;
    }
    return copy.CommitFolder();
}

// Changes the file itself. Nothing is rolled back when the change fails or is cut short, so signals wait for its end;
// what a failed change left after the content is cut off, because it would stand in the way of the next one. A process
// that is killed all the same leaves the file as far as the change had got: a backup, if one was asked for, was whole
// and committed before the first write.
FileProblem CSafeEdit::applyInPlace(const Change& change)
{
    if (FileProblem problem = options_.backup ? backupByCopy() : FileProblem())
        return problem;
    if (FileProblem problem = refusedBy(LookBefore(file_.get())))
        return problem;
    const platform::SignalHold hold;
    if (FileProblem problem = changeInPlace(change))
        return problem;
    if (FileProblem problem = refusedBy(LookAfter(file_.get(), file_.get())))
        return problem;
    if (options_.keepTimes && !platform::setFileTimes(file_.get(), attributes_.accessed, &attributes_.modified))
        return FileProblem::ofSystem();
    return systemCalls().fsync(file_.get()) == 0 ? FileProblem() : FileProblem::ofSystem();
}

FileProblem CSafeEdit::changeInPlace(const Change& change)
try {
    FileProblem problem = refusedBy(change(platform::pathOfDescriptor(file_.get())));
    if (problem)
        CutBack(file_.get());
    return problem;
} catch (...) {
    CutBack(file_.get());
    throw;
}

FileProblem CSafeEdit::backupByLink()
{
    backup_ = ownBackup();
    if (!backup_.empty())
        return {};
    for (int number = 0; number < kMostBackups; ++number) {
        const std::string name = backupName(target_, number);
        if (systemCalls().linkFile(target_.c_str(), name.c_str()) == 0) {
            backup_ = name;
            return {};
        }
        if (errno != EEXIST)
            return backupByCopy();
    }
    return {Kind::backups};
}

FileProblem CSafeEdit::backupByCopy()
{
    CTemporaryFile copy;
    if (FileProblem problem = copyTo(copy))
        return problem;
    if (FileProblem problem = CopyFileAttributes(file_.get(), attributes_, copy.Descriptor()))
        return problem;
    if (FileProblem problem = copy.Commit())
        return problem;
    for (int number = 0; number < kMostBackups; ++number) {
        const std::string name = backupName(target_, number);
        if (FileProblem problem = copy.Publish(name)) {
            if (problem.kind == Kind::system && problem.systemError == EEXIST)
                continue;
            return problem;
        }
        if (const FileProblem problem = copy.CommitFolder())
            return {Kind::uncommittedBackup, problem.systemError};
        backup_ = name;
        return {};
    }
    return {Kind::backups};
}
