#include "platform/posix/ItemKind.h"

#include <sys/stat.h>

namespace platform {

FileKind kindOfMode(std::uint32_t mode)
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
