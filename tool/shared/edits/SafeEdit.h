// Edits of files for the verbs: the library's safe edit with coordinated access and the command's messages.
#pragma once

#include "audiofile/CContainerEdit.h"
#include "tool/shared/access/FileAccess.h"

#include <functional>
#include <optional>
#include <string>

/// The options that every edit takes.
struct EditOptions {
    bool inPlace = false; // change the file itself, for recordings too large to copy
    bool dryRun = false;
    bool keepTimes = false; // keep the time of the last modification
    bool backup = false;    // keep the original as NAME.bak, NAME.bak.1 and so on
    bool quiet = false;
    std::optional<double> timeout; // seconds to wait for others each time; unlimited if not set

    WaitOptions waiting() const { return {.timeoutSeconds = timeout, .quiet = quiet}; }
};

/// One edit of one file. During its lifetime it has coordinated write access (for a dry run, read access), so that no
/// other coordinated program examines or changes the file; and the file is locked against edits by this command under
/// other users or other names. Both are waited for. Throws Failure.
class SafeEdit {
public:
    /// Follows symbolic links to the file itself, which must be regular and writable.
    SafeEdit(const std::string& path, const EditOptions& options);

    /// The file to change, symbolic links resolved; look at it here before `apply`.
    const std::string& target() const { return edit_.Target(); }

    /// Calls `change` with a path that leads to the file to change and to no other, whatever happens to its name.
    /// Everything outside the scope is compared afterwards. If anything throws, the original is unchanged to the byte;
    /// with `inPlace` it is as `change` left it, except for bytes after its end. Returns the path of the backup, spelt
    /// like the file's, or an empty string.
    std::string apply(const EditScope& scope, const std::function<void(const std::string& path)>& change);

private:
    std::string given_;
    EditOptions options_;
    FileAccess access_;
    CContainerEdit edit_;
};
