// A new file that takes a name only when it is whole. Until then it is called ".NAME.ktfiles-N", lies in the folder of
// its target, and is locked, so that the next run can tell one that a killed process left.
#pragma once

#include "tool/shared/access/Descriptor.h"

#include <signal.h>
#include <string>
#include <sys/stat.h>

/// Removed by the destructor, and by SIGINT, SIGTERM, SIGHUP and their like. At most 4 at a time. All names are looked
/// up in the folder that was opened first, wherever its path leads later.
class TemporaryFile {
public:
    /// Removes what killed processes left for `target` (an absolute or relative path), then creates the file with mode
    /// 0600. Throws Failure.
    explicit TemporaryFile(const std::string& target);
    ~TemporaryFile();
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    int descriptor() const { return descriptor_.get(); }
    /// A path that leads to this very file in this process, whatever became of its name meanwhile.
    std::string path() const { return pathOfDescriptor(descriptor_.get()); }

    /// Whether the name of the target is that of the file with this status.
    bool targetIs(const struct stat& status) const;

    /// Takes the name of the target, in the place of what has it. Throws Failure.
    void replace();
    /// Takes the last component of `name`, in the folder of the target, if nothing has it: true, or false when
    /// something does. Throws Failure.
    bool publish(const std::string& name);
    /// Commits the folder to storage, so that the name is there after a loss of power. False with errno on failure.
    bool synchronizeFolder() const;

private:
    bool create(const std::string& name);
    void requireItsName() const;
    void forget();

    Descriptor folder_;
    std::string targetName_;
    std::string name_; // empty: it has none of its own any more
    Descriptor descriptor_;
    int slot_ = -1;
};

/// Holds back the signals that end a process, for the moments in which it must not end.
class SignalHold {
public:
    SignalHold();
    ~SignalHold();
    SignalHold(const SignalHold&) = delete;
    SignalHold& operator=(const SignalHold&) = delete;

private:
    sigset_t before_;
};
