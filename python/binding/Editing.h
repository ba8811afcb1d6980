// Safe edits of one file, as every function of the module that changes one makes them.
#pragma once

#include "binding/Coordination.h"

#include "audiofile/CContainerEdit.h"

#include <functional>

struct Editing {
    bool inPlace = false;
    bool backup = false;
    bool keepTimes = false;
    Timeout timeout;
};

/// With write access to the file, and with it locked against other edits: `plan` looks at the file and says what the
/// edit is about, or that there is nothing to do (none); then `change` is applied. Called without the interpreter's
/// lock. Throws Problem. Returns the path of the backup, or an empty string.
std::string editSafely(const std::string& path, const Editing& editing,
                       const std::function<std::optional<EditScope>(const std::string& target)>& plan,
                       const std::function<void(const std::string& copy)>& change);
