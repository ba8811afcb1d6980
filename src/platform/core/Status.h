// Status codes of the file and container layers: 0 for success, negative for errors.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>

namespace platform {
struct Error;
}

/// The codes; StatusText() puts them into words.
enum : std::int32_t {
    kStatusOK = 0,                  // success
    kStatusInterrupted = -27,       // a signal or a callback stopped the operation
    kStatusDiskFull = -34,          // no space left on the device
    kStatusIOError = -36,           // a device failed; also every system error that is not listed
    kStatusBadName = -37,           // a name that is too long or not allowed
    kStatusNotOpen = -38,           // the file is not open, or not for that
    kStatusEndOfFile = -39,         // fewer bytes are left than were asked for
    kStatusBeforeStart = -40,       // a position below 0
    kStatusOutOfMemory = -41,       // memory is short, or the system's file table is full
    kStatusTooManyOpenFiles = -42,  // the process has no descriptor left
    kStatusFileNotFound = -43,      // nothing has this path
    kStatusFileBusy = -47,          // somebody else uses the file; also: the folder is not empty
    kStatusDuplicateName = -48,     // something has this name already
    kStatusParameterError = -50,    // an argument that makes no sense; a null pointer; a folder where a file is needed
    kStatusBadReference = -51,      // a reference that names nothing
    kStatusWritePermission = -61,   // the file system is read-only
    kStatusUserCancelled = -128,    // the user, or a handler, said stop
    kStatusNotAFile = -1302,        // a FIFO, socket or device where a file is needed
    kStatusDifferentVolume = -1303, // the two items lie on different volumes
    kStatusFileTooBig = -1309,      // the file would be larger than its format or file system allows
    kStatusNotAFolder = -1407,      // a file where a folder is needed
    kStatusQuotaExceeded = -1425,   // the user's quota is used up
    kStatusAccessDenied = -5000,    // the permissions do not allow it
    kStatusAuthenticationError = -5023, // the server did not accept the user
};

/// The status of the calling thread's current `errno`: 0 gives 0, an unlisted number kStatusIOError.
KT_EXPORT std::int32_t PosixErrorToOSErr();
/// The status of a given system error number.
KT_EXPORT std::int32_t PosixErrorToOSErr(int systemError);

/// The status of an error object; null gives 0. An error of the application domain counts as its underlying error.
/// The status domain gives its code unchanged, the system domain is mapped as PosixErrorToOSErr maps it, and any
/// other domain gives -1, as does an application error without an underlying one.
KT_EXPORT std::int32_t NSErrorToOSErr(const platform::Error* error);

/// A short English text for a status ("disk full"), for messages to people; never null.
KT_EXPORT const char* StatusText(std::int32_t status);
