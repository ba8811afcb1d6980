#include "files/CFileUtil.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

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
