#include "tool/shared/access/Descriptor.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>

Descriptor openRegularFile(const std::string& path, int access)
{
    const Descriptor found(::open(path.c_str(), O_PATH | O_CLOEXEC));
    struct stat status = {};
    if (!found || ::fstat(found.get(), &status) != 0)
        return Descriptor();
    if (!S_ISREG(status.st_mode)) {
        errno = S_ISDIR(status.st_mode) ? EISDIR : ENXIO;
        return Descriptor();
    }
    return Descriptor(::open(pathOfDescriptor(found.get()).c_str(), access | O_CLOEXEC | O_NOCTTY));
}
