// A new file that takes a name only when it is whole. Until then it is called ".NAME.ktfiles-N", lies in the folder of
// its target, and is locked, so that the next one for that target can tell what a killed process left.
#pragma once

#include "files/FileProblem.h"
#include "platform/OwnedDescriptor.h"
#include "platform/SystemCalls.h"

#include <string>

/// Removed by the destructor unless it took a name. All names are looked up in the folder that was opened first,
/// wherever its path leads later. Signals that end processes are held back from the calling thread while a name
/// changes (platform/SignalHold.h). One thread at a time.
class KT_EXPORT CTemporaryFile {
public:
    CTemporaryFile() = default;
    ~CTemporaryFile();
    CTemporaryFile(const CTemporaryFile&) = delete;
    CTemporaryFile& operator=(const CTemporaryFile&) = delete;

    /// Removes what killed processes left for `target` (an absolute or relative path), then creates the file with
    /// permissions 0600. Once only. Problems: folder, creation, noFreeName.
    FileProblem Create(const std::string& target);

    /// Open for reading and writing; -1 before Create.
    int Descriptor() const { return descriptor_.get(); }
    /// A path that leads to this very file in this process, whatever became of its name meanwhile.
    std::string Path() const { return platform::pathOfDescriptor(descriptor_.get()); }

    /// Whether the name of the target is that of the item with this status.
    bool TargetIs(const platform::FileStatus& status) const;

    /// Commits the content to storage.
    FileProblem Commit() const;
    /// Takes the name of the target, in the place of what has it. Problems: givenAway, system.
    FileProblem Replace();
    /// Takes the last component of `name`, in the folder of the target, if nothing has it; else the problem is `system`
    /// with EEXIST, and another name can be tried. Problems: givenAway, system.
    FileProblem Publish(const std::string& name);
    /// Commits the folder to storage, so that the name is there after a loss of power: `uncommitted` when that fails.
    FileProblem CommitFolder() const;

    /// Removes the temporary files of this process, sixteen of them at most; others stay until the next one for their
    /// target. A signal handler may call it, if the process ends then.
    static void RemoveAllFromSignalHandler();

private:
    bool createAs(const std::string& name, FileProblem& problem);
    FileProblem requireItsName() const;
    void forget();

    platform::OwnedDescriptor folder_;
    std::string targetName_;
    std::string name_; // empty: it has none of its own any more
    platform::OwnedDescriptor descriptor_;
    int slot_ = -1;
};
