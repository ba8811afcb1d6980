#include "platform/ApplicationInfo.h"

#include <errno.h>

namespace platform {

namespace {

ApplicationInfo& currentInfo()
{
    static ApplicationInfo info{program_invocation_short_name, "0"};
    return info;
}

} // namespace

const ApplicationInfo& applicationInfo()
{
    return currentInfo();
}

void setApplicationInfo(ApplicationInfo info)
{
    currentInfo() = std::move(info);
}

} // namespace platform
