#include "tool/shared/input/FileLocation.h"

#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>
#include <climits>
#include <unistd.h>

namespace {

std::string absolutePath(const std::string& path)
{
    if (path.starts_with('/'))
        return path;
    if (path.empty())
        throw Failure(SystemErrorText(ENOENT));
    char buffer[PATH_MAX]; // no path in system calls is longer
    if (::getcwd(buffer, sizeof buffer) == nullptr)
        throw Failure(SystemErrorText(errno));
    std::string folder = buffer;
    if (!folder.ends_with('/'))
        folder += '/';
    return folder + path;
}

} // namespace

platform::URLRef fileLocation(const std::string& name)
{
    // Avoids CFileRef's paths, in which a leading "~" means a home folder: the shell has expanded that already.
    const std::string absolute = absolutePath(systemPath(name));
    platform::URLRef url = platform::URL::createWithFileSystemBytes(absolute, false);
    if (!url)
        throw Failure("its path cannot be a file URL");
    return url;
}
