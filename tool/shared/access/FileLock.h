// Waits for a file that another edit has locked.
#pragma once

#include "tool/shared/access/Waiting.h"

#include <string>

/// Waits for the lock on the file, which is at `path`; false if the file system has no locks. Throws Failure on a
/// timeout.
/// time is up.
bool waitForLock(int descriptor, const std::string& path, const WaitOptions& wait);
