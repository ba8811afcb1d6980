// Edits that cannot leave a file half done: a copy in the same folder is changed, and then takes the place of the
// original with its owner, permissions, times and extended attributes.
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

/// How an edit is made.
struct SafeEditOptions {
    bool inPlace = false;   // change the file itself: for files too large to copy, and for files of several names
    bool keepTimes = false; // keep the time of the last modification
    bool backup = false;    // keep the original beside it as NAME.bak, NAME.bak.1 and so on
    /// Called when another edit has the file locked: waits until it has locked this descriptor, and returns 0, or a
    /// status to give up with. Without it the edit waits as long as it takes.
    std::function<std::int32_t(int descriptor, const std::string& path)> waitForLock = {};
    FileCopyProgress progress = {}; // hears of the copying
};

/// One edit of one file. From Begin to its destruction the file is locked against other edits of this kind, by
/// whatever name and user; they wait. Coordinated access (platform/FileCoordination.h) is the caller's: take it
/// first. Exceptions of callbacks pass through, with the file as after a failure. One thread.
class KT_EXPORT CSafeEdit {
public:
    /// Changes the file at the path, and returns 0 or a status to fail with.
    using Change = std::function<std::int32_t(const std::string& path)>;

    CSafeEdit() = default;
    virtual ~CSafeEdit() = default;
    CSafeEdit(const CSafeEdit&) = delete;
    CSafeEdit& operator=(const CSafeEdit&) = delete;

    /// Opens and locks the file, symbolic links followed, which must be regular and writable. Call it once. Problems:
    /// system (ENXIO: no regular file), refused (by waitForLock), hardLinks, sameAsBackup.
    FileProblem Begin(const std::string& path, SafeEditOptions options = {});

    /// The file to be changed, symbolic links resolved; callers look at it between Begin and Apply.
    const std::string& Target() const { return target_; }
    /// The length of the file at Begin, in bytes.
    std::int64_t Size() const { return status_.size; }

    /// Calls `change` with a path that leads to the file to change and to no other, whatever happens to its name.
    /// After a problem other than `uncommitted` the original is as it was, to the byte, and no copy is left; with
    /// `inPlace` it is as `change` left it, but for what CutBack removes.
    FileProblem Apply(const Change& change);

    /// The path of the backup of the last Apply; empty when there is none.
    const std::string& Backup() const { return backup_; }

protected:
    /// Called ahead of a change in place, with the original still intact. A status other than 0 ends the edit.
    virtual std::int32_t LookBefore(int original);
    /// Judges the outcome: 0, or the status to fail with. In place, both descriptors are one.
    virtual std::int32_t LookAfter(int original, int edited);
    /// Called when a change in place failed: may remove what it left past the end of the content.
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
