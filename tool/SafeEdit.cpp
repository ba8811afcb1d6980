#include "SafeEdit.h"

#include "Failure.h"
#include "FileCopy.h"
#include "FileLock.h"
#include "InputFile.h"
#include "Progress.h"
#include "TemporaryFile.h"
#include "Terminal.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <memory>

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
               ? accessForReading(target, {.quiet = options.quiet})
               : accessForWriting(target, options.inPlace ? WritingOptions::none : WritingOptions::forReplacing,
                                  {.quiet = options.quiet});
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
    if (status_.st_nlink > 1 && !options_.inPlace)
        throw Failure(fmt::format("has {} names (hard links), and the others would keep the old content; --in-place "
                                  "edits the file itself",
                                  status_.st_nlink));
}

void SafeEdit::open()
{
    file_ = Descriptor(::open(target_.c_str(), O_RDWR | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    if (!file_)
        throw Failure(systemErrorText(errno));
}

void SafeEdit::waitForOthers()
{
    // Without locks on this file system the check before the rename is what is left.
    waitForLock(file_.get(), target_, {.quiet = options_.quiet});
}

bool SafeEdit::isStillAtTarget() const
{
    struct stat opened = {}, named = {};
    if (::fstat(file_.get(), &opened) != 0 || ::stat(target_.c_str(), &named) != 0)
        throw Failure(systemErrorText(errno));
    if (!S_ISREG(opened.st_mode))
        throw Failure("not a regular file");
    return opened.st_dev == named.st_dev && opened.st_ino == named.st_ino;
}

void SafeEdit::requireUntouched() const
{
    struct stat now = {};
    if (::fstat(file_.get(), &now) != 0)
        throw Failure(systemErrorText(errno));
    if (!isStillAtTarget() || now.st_size != status_.st_size || !sameTime(now.st_mtim, status_.st_mtim) ||
        !sameTime(now.st_ctim, status_.st_ctim))
        throw Failure("was changed by another program meanwhile; nothing was done");
}

std::string SafeEdit::apply(const std::function<void(const std::string&)>& change)
{
    return options_.inPlace ? applyInPlace(change) : applyToCopy(change);
}

std::string SafeEdit::applyToCopy(const std::function<void(const std::string&)>& change)
{
    TemporaryFile copy(target_);
    {
        Progress progress("copying", status_.st_size, options_.quiet);
        copyContent(file_.get(), copy.descriptor(), progress);
    }
    change(copy.path());
    copyAttributes(file_.get(), status_, copy.descriptor());
    synchronize(copy.descriptor());

    const SignalHold hold;
    requireUntouched();
    const std::string backup = options_.backup ? backupByLink() : std::string();
    try {
        copy.replace(target_);
    } catch (...) {
        if (!backup.empty())
            ::unlink(backup.c_str());
        throw;
    }
    synchronizeFolderOf(target_.c_str());
    return backup;
}

std::string SafeEdit::applyInPlace(const std::function<void(const std::string&)>& change)
{
    const std::string backup = options_.backup ? backupByCopy() : std::string();
    // The change is not undone when it is cut short, so that Ctrl-C must wait for its end.
    const SignalHold hold;
    change(target_);
    synchronize(file_.get());
    return backup;
}

std::string SafeEdit::backupByLink() const
{
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
    {
        Progress progress("copying", status_.st_size, options_.quiet);
        copyContent(file_.get(), copy.descriptor(), progress);
    }
    copyAttributes(file_.get(), status_, copy.descriptor());
    synchronize(copy.descriptor());
    for (int number = 0; number < kMostBackups; ++number) {
        const std::string name = backupName(target_, number);
        if (!copy.publish(name))
            continue;
        synchronizeFolderOf(name.c_str());
        return name;
    }
    throw Failure("has too many backups");
}
