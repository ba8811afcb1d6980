// URLs of a test by path, and back.
#pragma once

#include "platform/URL.h"

#include <string>

inline platform::String text(const std::string& utf8)
{
    return platform::String::fromUTF8(utf8);
}

inline platform::URLRef urlOf(const std::string& path, bool isDirectory = false)
{
    return platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path), platform::PathStyle::posix,
                                                   isDirectory);
}

/// "(null)" for no URL, and for one without such a path.
inline std::string pathOf(const platform::URLRef& url, platform::PathStyle style = platform::PathStyle::posix)
{
    const platform::String path = url ? url->copyFileSystemPath(style) : nullptr;
    return path.isNull() ? "(null)" : path.utf8();
}
