#include "audiofile/ContainerProblem.h"

#include "platform/core/Status.h"

std::int32_t ContainerProblem::Status() const
{
    if (kind == Kind::none)
        return kStatusOK;
    if (status < 0)
        return status;
    return systemError != 0 ? PosixErrorToOSErr(systemError) : kStatusParameterError;
}
