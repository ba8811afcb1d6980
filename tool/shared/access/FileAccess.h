// Coordinated access of the verbs to the files that they read and change.
#pragma once

#include "platform/FileCoordination.h"
#include "tool/shared/access/Waiting.h"

#include <memory>
#include <string>

using FileAccess = std::unique_ptr<platform::CoordinatedAccess>;

/// Keeps writers away during the lifetime of the result. Null if the system refuses coordination, in which case the
/// file is read without it, and under a `ktfiles lock` of the file that runs this process. Throws Failure, also on a
/// timeout.
FileAccess accessForReading(const std::string& path, const WaitOptions& wait);

/// Keeps everybody else away during the lifetime of the result. Null under a `ktfiles lock` of the file that does so
/// already. Throws Failure, also if the system refuses coordination, and on a timeout.
FileAccess accessForWriting(const std::string& path, platform::FileCoordinator::WritingOptions options,
                            const WaitOptions& wait);
