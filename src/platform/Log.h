// Lines for people who look for the cause of a failure; no result of the library depends on them.
#pragma once

#include "platform/core/Export.h"

#include <string>

namespace platform {

/// Takes one line without its end, on the thread on which the failure happened.
using LogHandler = void (*)(const char* line);

/// Sets the handler of lines and returns the one before. Null silences the library; the first handler writes to
/// standard error.
KT_EXPORT LogHandler setLogHandler(LogHandler handler);
/// Hands a line to the handler in force.
KT_EXPORT void logLine(const std::string& line);

} // namespace platform
