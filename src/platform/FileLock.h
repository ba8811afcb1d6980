// Advisory locks on whole files: edits of one file wait for each other by them, and a live temporary file is told by
// its lock from one that a killed process left.
#pragma once

#include "platform/core/Export.h"

namespace platform {

/// unsupported: the file system has no locks, or no memory for one.
enum class FileLockResult { locked, busy, unsupported };

/// Locks the file for this descriptor, against all others of this and every other process, without waiting. The lock
/// ends when the descriptor, with all copies of it, is closed. The descriptor must be open for writing.
KT_EXPORT FileLockResult tryToLockFile(int descriptor);
/// The same, waiting for as long as it takes.
KT_EXPORT FileLockResult waitToLockFile(int descriptor);

} // namespace platform
