#include "files/CFileUtil.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

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
