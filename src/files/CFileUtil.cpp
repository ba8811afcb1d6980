// Making, deleting and measuring files by their references.
#include "files/CFileUtil.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <cstdio>

std::int32_t CFileUtilCreate(const CFileRef& file, FourCC /*type*/, FourCC /*creator*/, std::uint32_t permissions)
{
    const char* path = file.GetPath();
    if (path == nullptr)
        return kStatusParameterError;
    const platform::SystemCalls& system = platform::systemCalls();
    const int descriptor = system.createFile(path, permissions);
    if (descriptor < 0 || system.close(descriptor) != 0)
        return PosixErrorToOSErr();
    return kStatusOK;
}

std::int32_t CFileUtilDelete(const CFileRef& file)
{
    const char* path = file.GetPath();
    if (path == nullptr)
        return kStatusParameterError;
    platform::FileStatus status;
    if (!platform::systemCalls().linkStatus(path, &status))
        return PosixErrorToOSErr();
    if (status.kind == platform::FileKind::directory) // std::remove would delete an empty folder
        return kStatusParameterError;
    return std::remove(path) == 0 ? kStatusOK : PosixErrorToOSErr();
}

long long CFileUtilFileSize(const CFileRef& file)
{
    const char* path = file.GetPath();
    if (path == nullptr)
        return kStatusParameterError;
    platform::FileStatus status;
    if (!platform::systemCalls().pathStatus(path, &status))
        return PosixErrorToOSErr();
    if (status.kind == platform::FileKind::directory)
        return kStatusParameterError;
    return status.size;
}
