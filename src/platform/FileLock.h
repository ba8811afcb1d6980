// Advisory locks on whole files. Edits of one file wait for each other by them, and the lock on a temporary file
// tells whether its process still lives.
#pragma once

#include "platform/core/Export.h"

namespace platform {

/// The outcome of locking. unsupported: the file system has no locks, or no memory for one.
enum class FileLockResult { locked, busy, unsupported };

/// Locks the file for this descriptor, against every other descriptor of this and other processes, without waiting.
/// The lock ends when the descriptor and all copies of it are closed. The descriptor must be open for writing.
KT_EXPORT FileLockResult tryToLockFile(int descriptor);
/// The same, but waits for as long as it takes.
KT_EXPORT FileLockResult waitToLockFile(int descriptor);

} // namespace platform
