// Advisory locks by which edits of one file wait for each other, and by which a live temporary file is told from one
// that a killed process left.
#pragma once

#include "tool/shared/access/Waiting.h"

#include <string>

enum class LockResult { locked, busy, unsupported };

/// Locks the whole file for this descriptor without waiting; the lock ends when the descriptor is closed.
LockResult tryLock(int descriptor);

/// Waits for the lock on the file, which is at `path`; false where the file system has none. Throws Failure when the
/// time is up.
bool waitForLock(int descriptor, const std::string& path, const WaitOptions& wait);
