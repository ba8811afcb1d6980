#include "files/CFileUtil.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <cstdio>

std::int32_t CFileUtilDelete(const CFileRef& file)
{
    const char* path = file.GetPath();
    if (path == nullptr)
        return kStatusParameterError;
    platform::FileStatus status;
    if (!platform::systemCalls().linkStatus(path, &status))
        return PosixErrorToOSErr();
    if (status.kind == platform::FileKind::directory) // which std::remove takes when it is empty
        return kStatusParameterError;
    return std::remove(path) == 0 ? kStatusOK : PosixErrorToOSErr();
}
