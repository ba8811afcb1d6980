// A new file that takes its name only when it is whole. Until then it is called ".NAME.ktfiles-N", lies in the folder
// of its target, and is locked: an unlocked one was left by a killed process.
#pragma once

#include "files/FileProblem.h"
#include "platform/OwnedDescriptor.h"
#include "platform/SystemCalls.h"

#include <string>

/// A file that is removed unless it takes a name. All names are looked up in the folder that Create opened, wherever
/// its path leads later. Signals that end processes are held back from the calling thread while a name changes
/// (platform/SignalHold.h). One thread at a time.
class KT_EXPORT CTemporaryFile {
public:
    CTemporaryFile() = default;
    ~CTemporaryFile();
    CTemporaryFile(const CTemporaryFile&) = delete;
    CTemporaryFile& operator=(const CTemporaryFile&) = delete;

    /// Removes what killed processes left for `target` (an absolute or relative path), then creates the file with
    /// permissions 0600. Call it once. Problems: folder, creation, noFreeName.
    FileProblem Create(const std::string& target);

    /// The descriptor, open for reading and writing; -1 before Create.
    int Descriptor() const { return descriptor_.get(); }
    /// A path that leads to this very file in this process, whatever became of its name.
    std::string Path() const { return platform::pathOfDescriptor(descriptor_.get()); }

    /// Whether the target's name belongs to the item with this status.
    bool TargetIs(const platform::FileStatus& status) const;

    /// Commits the content to storage.
    FileProblem Commit() const;
    /// Takes the name of the target and replaces what has it. Problems: givenAway, system.
    FileProblem Replace();
    /// Takes the last component of `name`, in the folder of the target, if it is free; otherwise the problem is
    /// `system` with EEXIST, and another name can be tried. Problems: givenAway, system.
    FileProblem Publish(const std::string& name);
    /// Commits the folder to storage, so that the name survives a loss of power. Problem: uncommitted.
    FileProblem CommitFolder() const;

    /// Removes the temporary files of this process, at most sixteen; others stay until the next file for their
    /// target. A signal handler may call it if the process then ends.
    static void RemoveAllFromSignalHandler();

private:
    bool createAs(const std::string& name, FileProblem& problem);
    FileProblem requireItsName() const;
    void forget();

    platform::OwnedDescriptor folder_;
    std::string targetName_;
    std::string name_; // empty: the temporary name is gone
    platform::OwnedDescriptor descriptor_;
    int slot_ = -1;
};
