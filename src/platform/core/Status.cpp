#include "platform/core/Status.h"

#include "platform/core/Error.h"

#include <cerrno>
#include <limits>

namespace {

struct SystemErrorStatus {
    int systemError;
    std::int32_t status;
};

constexpr SystemErrorStatus systemErrorStatuses[] = {
    {0, kStatusOK},
    {EINTR, kStatusInterrupted},
    {ENOSPC, kStatusDiskFull},
    {ENAMETOOLONG, kStatusBadName},
    {ENOMEM, kStatusOutOfMemory},
    {ENFILE, kStatusOutOfMemory},
    {EMFILE, kStatusTooManyOpenFiles},
    {ENOENT, kStatusFileNotFound},
    {EBUSY, kStatusFileBusy},
    {ETXTBSY, kStatusFileBusy},
    {ENOTEMPTY, kStatusFileBusy},
    {EEXIST, kStatusDuplicateName},
    {EINVAL, kStatusParameterError},
    {EFAULT, kStatusParameterError},
    {EISDIR, kStatusParameterError},
    {EBADF, kStatusBadReference},
    {ESTALE, kStatusBadReference},
    {ELOOP, kStatusBadReference},
    {EROFS, kStatusWritePermission},
    {ECANCELED, kStatusUserCancelled},
    {ENXIO, kStatusNotAFile}, // a FIFO, socket or device where a file is needed (platform/SystemCalls.h)
    {EXDEV, kStatusDifferentVolume},
    {EFBIG, kStatusFileTooBig},
    {EOVERFLOW, kStatusFileTooBig},
    {ENOTDIR, kStatusNotAFolder},
    {EDQUOT, kStatusQuotaExceeded},
    {EACCES, kStatusAccessDenied},
    {EPERM, kStatusAccessDenied},
    {ENOKEY, kStatusAuthenticationError},
    {EKEYEXPIRED, kStatusAuthenticationError},
    {EKEYREVOKED, kStatusAuthenticationError},
    {EKEYREJECTED, kStatusAuthenticationError},
};

struct NamedStatus {
    std::int32_t status;
    const char* text;
};

constexpr NamedStatus namedStatuses[] = {
    {kStatusOK, "no error"},
    {kStatusInterrupted, "operation interrupted"},
    {kStatusDiskFull, "disk full"},
    {kStatusIOError, "input/output error"},
    {kStatusBadName, "bad name"},
    {kStatusNotOpen, "file not open"},
    {kStatusEndOfFile, "end of file"},
    {kStatusBeforeStart, "position before start of file"},
    {kStatusOutOfMemory, "out of memory"},
    {kStatusTooManyOpenFiles, "too many open files"},
    {kStatusFileNotFound, "file not found"},
    {kStatusFileBusy, "file busy or folder not empty"},
    {kStatusDuplicateName, "duplicate name"},
    {kStatusParameterError, "parameter error"},
    {kStatusBadReference, "bad file reference"},
    {kStatusWritePermission, "write permission error"},
    {kStatusUserCancelled, "user cancelled"},
    {kStatusNotAFile, "not a file"},
    {kStatusDifferentVolume, "different volume"},
    {kStatusFileTooBig, "file too big"},
    {kStatusNotAFolder, "not a folder"},
    {kStatusQuotaExceeded, "quota exceeded"},
    {kStatusAccessDenied, "access denied"},
    {kStatusAuthenticationError, "authentication error"},
};

} // namespace

std::int32_t PosixErrorToOSErr()
{
    return PosixErrorToOSErr(errno);
}

std::int32_t PosixErrorToOSErr(int systemError)
{
    for (const SystemErrorStatus& entry : systemErrorStatuses)
        if (entry.systemError == systemError)
            return entry.status;
    return kStatusIOError;
}

std::int32_t NSErrorToOSErr(const platform::Error* error)
{
    if (error == nullptr)
        return kStatusOK;
    if (error->domain == platform::ErrorDomain::application)
        error = error->underlying.get();
    if (error != nullptr && error->domain == platform::ErrorDomain::status)
        return static_cast<std::int32_t>(error->code);
    if (error != nullptr && error->domain == platform::ErrorDomain::system) {
        // Codes of the system are never wider than an int; a wider one counts as unlisted.
        const bool fits = error->code >= 0 && error->code <= std::numeric_limits<int>::max();
        return fits ? PosixErrorToOSErr(static_cast<int>(error->code)) : kStatusIOError;
    }
    return -1;
}

const char* StatusText(std::int32_t status)
{
    for (const NamedStatus& entry : namedStatuses)
        if (entry.status == status)
            return entry.text;
    return "unknown error";
}
