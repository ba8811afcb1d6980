// Lines for people who look for the cause of a failure; what the library returns never depends on them.
#pragma once

#include "platform/core/Export.h"

#include <string>

namespace platform {

/// Takes one line without its end; called on whatever thread the failure happened.
using LogHandler = void (*)(const char* line);

/// Replaces what becomes of lines and returns the handler in force before. Null silences the library; the first
/// handler writes to standard error.
KT_EXPORT LogHandler setLogHandler(LogHandler handler);
KT_EXPORT void logLine(const std::string& line);

} // namespace platform
