// Status codes of the file and container layers: 0 for success, negative for errors.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>

namespace platform {
struct Error;
}

enum : std::int32_t {
    kStatusOK = 0,
    kStatusInterrupted = -27,
    kStatusDiskFull = -34,
    kStatusIOError = -36, // also every unlisted system error
    kStatusBadName = -37,
    kStatusNotOpen = -38,
    kStatusEndOfFile = -39,
    kStatusBeforeStart = -40,
    kStatusOutOfMemory = -41, // also: file table full
    kStatusTooManyOpenFiles = -42,
    kStatusFileNotFound = -43,
    kStatusFileBusy = -47, // also: folder not empty
    kStatusDuplicateName = -48,
    kStatusParameterError = -50, // also null pointers, and a folder where a file is needed
    kStatusBadReference = -51,
    kStatusWritePermission = -61, // read-only file system
    kStatusUserCancelled = -128,
    kStatusNotAFile = -1302,
    kStatusDifferentVolume = -1303,
    kStatusFileTooBig = -1309,
    kStatusNotAFolder = -1407,
    kStatusQuotaExceeded = -1425,
    kStatusAccessDenied = -5000,
    kStatusAuthenticationError = -5023,
};

/// The status of the calling thread's current system error number: 0 gives 0, an unlisted one kStatusIOError.
KT_EXPORT std::int32_t PosixErrorToOSErr();
/// The same for a given system error number.
KT_EXPORT std::int32_t PosixErrorToOSErr(int systemError);

/// The status of an error object. An error of the application domain is replaced by its underlying error first; then
/// the status domain gives its code unchanged, the system domain is mapped as by PosixErrorToOSErr, and any other
/// domain, like an application error with nothing below it, gives -1. Null gives 0.
KT_EXPORT std::int32_t NSErrorToOSErr(const platform::Error* error);

/// A short English text for a status ("disk full"), never null; for messages to people.
KT_EXPORT const char* StatusText(std::int32_t status);
