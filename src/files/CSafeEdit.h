// Edits that cannot leave a file half done: the change is made to a copy in the same folder, which then takes the place
// of the original with its owner, permissions, times and extended attributes.
#pragma once

#include "files/FileCopy.h"
#include "files/FileProblem.h"
#include "platform/FileAttributes.h"
#include "platform/OwnedDescriptor.h"
#include "platform/SystemCalls.h"

#include <cstdint>
#include <functional>
#include <string>

class CTemporaryFile;

struct SafeEditOptions {
    bool inPlace = false;   // change the file itself: for files too large to copy, and for those of several names
    bool keepTimes = false; // the time of the last modification stays
    bool backup = false;    // keep the original as NAME.bak, NAME.bak.1 and so on, beside it
    /// Called when another edit has the file locked: waits to lock this descriptor, and returns 0 or a status to give
    /// up with. Without it the edit waits for as long as that takes.
    std::function<std::int32_t(int descriptor, const std::string& path)> waitForLock = {};
    FileCopyProgress progress = {}; // of copying the file
};

/// One edit of one file. From Begin to its destruction the file is locked against other edits of this kind, by whatever
/// name and by whichever user; they wait. It knows nothing of coordinated access (platform/FileCoordination.h): who
/// holds others back so takes that access first. What callbacks throw passes through, with the file as after a failure.
/// One thread.
class KT_EXPORT CSafeEdit {
public:
    /// Makes the change to the file at the path, and returns 0 or a status to fail with.
    using Change = std::function<std::int32_t(const std::string& path)>;

    CSafeEdit() = default;
    virtual ~CSafeEdit() = default;
    CSafeEdit(const CSafeEdit&) = delete;
    CSafeEdit& operator=(const CSafeEdit&) = delete;

    /// Opens and locks the file, symbolic links followed, which must be regular and writable. Once only. Problems:
    /// system (ENXIO: no regular file), refused (by waitForLock), hardLinks and sameAsBackup.
    FileProblem Begin(const std::string& path, SafeEditOptions options = {});

    /// The file to be changed, symbolic links resolved: look at it here before Apply.
    const std::string& Target() const { return target_; }
    std::int64_t Size() const { return status_.size; }

    /// Calls `change` with a path that leads to the file to change, and to no other whatever happens to its name. After
    /// a problem other than `uncommitted` the original is as it was, to the byte, and no copy is left; with `inPlace`
    /// it is as `change` left it, but for what CutBack takes away.
    FileProblem Apply(const Change& change);

    /// Of the last Apply: the path of the backup, or an empty string.
    const std::string& Backup() const { return backup_; }

protected:
    /// Called ahead of a change in place: the last look at what the file was. A status other than 0 ends the edit.
    virtual std::int32_t LookBefore(int original);
    /// Whether what came of the change is as it should be: 0, or the status to fail with. In place both are one.
    virtual std::int32_t LookAfter(int original, int edited);
    /// After a change in place that failed: may take away what that left behind the end of the content.
    virtual void CutBack(int edited);

private:
    FileProblem open();
    FileProblem waitForOthers();
    FileProblem requireOneName() const;
    FileProblem requireUntouched(const CTemporaryFile& copy) const;
    bool isOwnBackup(const std::string& name) const;
    std::string ownBackup() const;
    FileProblem copyTo(CTemporaryFile& copy) const;
    FileProblem applyToCopy(const Change& change);
    FileProblem applyInPlace(const Change& change);
    FileProblem changeInPlace(const Change& change);
    FileProblem backupByLink();
    FileProblem backupByCopy();

    std::string target_, backup_;
    SafeEditOptions options_;
    platform::OwnedDescriptor file_;
    platform::FileStatus status_; // when the edit began
    platform::FileAttributes attributes_;
};
