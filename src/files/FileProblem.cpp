#include "files/FileProblem.h"

#include "platform/core/Status.h"

std::int32_t FileProblem::Status() const
{
    switch (kind) {
    case Kind::none:
        return kStatusOK;
    case Kind::refused:
        return status;
    case Kind::noFreeName:
    case Kind::backups:
        return kStatusDuplicateName;
    case Kind::givenAway:
    case Kind::changed:
        return kStatusFileBusy;
    case Kind::shortened:
        return kStatusEndOfFile;
    case Kind::hardLinks:
    case Kind::sameAsBackup:
        return kStatusParameterError;
    default:
        return systemError != 0 ? PosixErrorToOSErr(systemError) : kStatusIOError;
    }
}
