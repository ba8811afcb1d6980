// Access to files that others have open through the library too: waited for without the interpreter's lock, so that
// other threads run and Ctrl-C is heeded.
#pragma once

#include "platform/FileCoordination.h"

#include <memory>
#include <optional>
#include <string>

/// How long others are waited for, in seconds; none: for ever.
using Timeout = std::optional<double>;

/// What the module holds of a file for `ktfiles.lock`; null is none.
class HeldAccess {
public:
    /// Waits. Called without the interpreter's lock. Throws Problem, with ETIMEDOUT when the time is up.
    HeldAccess(const std::string& path, bool isWriting, Timeout timeout);
    ~HeldAccess();
    HeldAccess(const HeldAccess&) = delete;
    HeldAccess& operator=(const HeldAccess&) = delete;

private:
    platform::CoordinatedItem item_;
    bool isWriting_;
    std::unique_ptr<platform::CoordinatedAccess> access_;
};

/// For one edit; null where this process holds write access to the file already. Throws Problem too where it holds read
/// access, since the edit would wait for itself.
std::unique_ptr<platform::CoordinatedAccess> accessForEdit(const std::string& path, bool inPlace, Timeout timeout);

/// Waits for the lock that edits of a file take on it. For CSafeEdit.
std::int32_t waitForEdits(int descriptor, const std::string& path, Timeout timeout);
