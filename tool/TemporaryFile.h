// A new file that takes a name only when it is whole. Until then it is called ".NAME.ktfiles-PID-xxxx", lies in the
// folder of its target, and is locked, so that the next run can tell one that a killed process left.
#pragma once

#include "Descriptor.h"

#include <signal.h>
#include <string>

/// Removed by the destructor, and by SIGINT, SIGTERM, SIGHUP and their like. At most 4 at a time.
class TemporaryFile {
public:
    /// Removes what killed processes left for `target` (an absolute or relative path), then creates the file with mode
    /// 0600. Throws Failure.
    explicit TemporaryFile(const std::string& target);
    ~TemporaryFile();
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    int descriptor() const { return descriptor_.get(); }
    const std::string& path() const { return path_; }

    /// Takes the name of `target`, in the place of what has it. Throws Failure.
    void replace(const std::string& target);
    /// Takes the name `target` if nothing has it: true, or false when something does. Throws Failure.
    bool publish(const std::string& target);

private:
    void forget();

    std::string path_;
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
