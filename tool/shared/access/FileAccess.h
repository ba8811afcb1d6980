// Coordinated access of the verbs to the files that they read and change.
#pragma once

#include "platform/FileCoordination.h"
#include "tool/shared/access/Waiting.h"

#include <memory>
#include <string>

using FileAccess = std::unique_ptr<platform::CoordinatedAccess>;

/// For as long as the result lives nobody has write access. Null where the system refuses coordination: the file is
/// then read without it; and under a `ktfiles lock` of the file, which runs this process. Throws Failure, also when the
/// time is up.
FileAccess accessForReading(const std::string& path, const WaitOptions& wait);

/// For as long as the result lives nobody else has access. Null under a `ktfiles lock` of the file that holds others
/// back already. Throws Failure, also where the system refuses coordination, and when the time is up.
FileAccess accessForWriting(const std::string& path, platform::FileCoordinator::WritingOptions options,
                            const WaitOptions& wait);
