// The name and version of this process's application, which documents keep of the one that saved them.
#pragma once

#include "platform/core/Export.h"

#include <string>

namespace platform {

/// An application, as people know it.
struct ApplicationInfo {
    std::string name;        // for people, UTF-8
    std::string fullVersion; // such as "2.1.0"
};

/// The application that the host named; until then the name of the program's file, and version "0".
KT_EXPORT const ApplicationInfo& applicationInfo();
/// Names the application. Call it once, at start-up, before any other thread runs. A program's file does not tell its
/// name for people.
KT_EXPORT void setApplicationInfo(ApplicationInfo info);

} // namespace platform
