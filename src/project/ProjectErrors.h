// Errors of the project layer: those of the system, and its own.
#pragma once

#include "platform/core/Error.h"

#include <cerrno>
#include <cstring>
#include <string>

/// Fills `error` from errno, with `what` ahead of the text unless it is empty; always false.
inline bool failWithSystemError(platform::Error* error, const std::string& what = "")
{
    const int number = errno;
    return platform::fail(error, platform::ErrorDomain::system, number,
                          (what.empty() ? "" : what + ": ") + std::strerror(number));
}
