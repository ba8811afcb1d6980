// Which application this process is, as documents name the one that saved them.
#pragma once

#include "platform/core/Export.h"

#include <string>

namespace platform {

struct ApplicationInfo {
    std::string name;
    std::string fullVersion;
};

/// What the host said; until then the name of the program's file, and the version "0".
KT_EXPORT const ApplicationInfo& applicationInfo();
/// Called by a host at start-up, once, ahead of any other thread: nothing in a program's file tells its name for
/// people.
KT_EXPORT void setApplicationInfo(ApplicationInfo info);

} // namespace platform
