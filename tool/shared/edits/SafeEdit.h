// Edits of files as the verbs make them: by a safe edit of the library, with coordinated access, in the command's
// words.
#pragma once

#include "audiofile/CContainerEdit.h"
#include "tool/shared/access/FileAccess.h"

#include <functional>
#include <optional>
#include <string>

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
    const std::string& target() const { return edit_.Target(); }

    /// Calls `change` with a path that leads to the file to change, and to no other whatever happens to its name. What
    /// is not in the scope is compared afterwards. When anything throws, the original is as it was, to the byte; with
    /// `inPlace` it is as `change` left it, but for what hangs behind its end. Returns the path of the backup, in the
    /// words in which the file was named, or an empty string.
    std::string apply(const EditScope& scope, const std::function<void(const std::string& path)>& change);

private:
    std::string given_;
    EditOptions options_;
    FileAccess access_;
    CContainerEdit edit_;
};
