// The path that reaches a URL's item in system calls.
#pragma once

#include "platform/URL.h"

#include <string>

namespace platform {

/// Empty if the URL has no absolute path: one of another scheme or host, or a relative one. Lives as long as the URL.
inline const std::string& absolutePath(const URL& url)
{
    static const std::string none;
    return url.posixPath().starts_with('/') ? url.posixPath() : none;
}

} // namespace platform
