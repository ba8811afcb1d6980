#include "platform/core/SystemErrorText.h"

#include "platform/core/Status.h"

#include <cerrno>
#include <cstring>

std::string SystemErrorText(int systemError)
{
    const std::int32_t status = PosixErrorToOSErr(systemError);
    const bool saysTooLittle = (status == kStatusIOError && systemError != EIO) || systemError == ELOOP;
    return saysTooLittle ? std::strerror(systemError) : StatusText(status);
}
