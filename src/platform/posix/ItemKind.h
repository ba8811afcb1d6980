// What kind of item a mode says.
#pragma once

#include "platform/SystemCalls.h"

#include <sys/stat.h>

namespace platform {

/// Of the mode bits of `stat` and `statx`.
inline FileKind kindOfMode(mode_t mode)
{
    switch (mode & S_IFMT) {
    case S_IFREG:
        return FileKind::file;
    case S_IFDIR:
        return FileKind::directory;
    case S_IFLNK:
        return FileKind::symbolicLink;
    default:
        return FileKind::other;
    }
}

} // namespace platform
