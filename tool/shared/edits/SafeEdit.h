// Edits that cannot leave a file half done: the change is made to a copy in the same folder, which then takes the
// place of the original with its mode, owner and extended attributes.
#pragma once

#include "tool/shared/access/Descriptor.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/edits/EditScope.h"

#include <functional>
#include <optional>
#include <string>
#include <sys/stat.h>

class TemporaryFile;

/// The options that every edit takes.
struct EditOptions {
    bool inPlace = false; // change the file itself: for recordings too large to copy
    bool dryRun = false;
    bool keepTimes = false; // the time of the last modification stays
    bool backup = false;    // keep the original as NAME.bak, NAME.bak.1 and so on
    bool quiet = false;
    std::optional<double> timeout; // seconds to wait for others, each time; none: for ever

    WaitOptions waiting() const { return {.timeoutSeconds = timeout, .quiet = quiet}; }
};

/// One edit of one file. From construction to destruction it has coordinated write access (a dry run: read access), so
/// that nobody who coordinates looks at the file or changes it meanwhile; and the file is locked against edits by this
/// command of other users, or under another name. They wait. Throws Failure.
class SafeEdit {
public:
    /// Follows symbolic links to the file itself, which must be regular and writable.
    SafeEdit(const std::string& path, const EditOptions& options);

    /// The file to be changed, symbolic links resolved: look at it here before `apply`.
    const std::string& target() const { return target_; }

    /// Calls `change` with a path that leads to the file to change, and to no other whatever happens to its name. What
    /// is not in the scope is compared afterwards. When anything throws, the original is as it was, to the byte; with
    /// `inPlace` it is as `change` left it, but for what hangs behind its end. Returns the path of the backup, or an
    /// empty string.
    std::string apply(const EditScope& scope, const std::function<void(const std::string& path)>& change);

private:
    using Change = std::function<void(const std::string&)>;

    void open();
    void waitForOthers();
    bool isStillAtTarget() const;
    void requireOneName() const;
    bool isOwnBackup(const std::string& name) const;
    std::string ownBackup() const;
    void requireUntouched(bool isAtTarget) const;
    std::string applyToCopy(const EditScope& scope, const Change& change);
    std::string applyInPlace(const EditScope& scope, const Change& change);
    void cutBack(const EditScope& scope) const;
    void copyTo(TemporaryFile& copy) const;
    std::string backupByLink() const;
    std::string backupByCopy() const;

    std::string target_;
    EditOptions options_;
    FileAccess access_;
    Descriptor file_;
    struct stat status_ = {}; // when the edit began
};
