#include "files/FileProblem.h"

#include "platform/core/Status.h"
#include "platform/core/SystemErrorText.h"

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

std::string FileProblem::Description() const
{
    const std::string why = SystemErrorText(systemError);
    switch (kind) {
    case Kind::none:
        break;
    case Kind::system:
        return systemError == ENXIO ? "not a regular file" : why;
    case Kind::folder:
        return "its folder: " + why;
    case Kind::creation:
        return "no file can be made in its folder: " + why;
    case Kind::noFreeName:
        return "no temporary file can be made in its folder";
    case Kind::givenAway:
        return "its temporary file was moved by another program; nothing was done";
    case Kind::shortened:
        return "became shorter while it was copied";
    case Kind::owner:
        return "its owner cannot be kept: " + why;
    case Kind::attribute:
        return "its extended attribute " + name + " cannot be kept: " + why;
    case Kind::hardLinks:
        return "has " + std::to_string(count) + " names (hard links), and the others would keep the old content";
    case Kind::sameAsBackup:
        return name + " is the same file still, left so by an edit that was cut short, and would change with it";
    case Kind::backups:
        return "has too many backups";
    case Kind::uncommittedBackup:
        return "its backup cannot be committed to storage: " + why;
    case Kind::changed:
        return "was changed by another program meanwhile; nothing was done";
    case Kind::refused:
        return StatusText(status);
    case Kind::uncommitted:
        return "is edited, but a loss of power now may undo that: its folder cannot be committed to storage: " + why;
    }
    return "";
}
