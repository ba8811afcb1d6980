#include "tool/shared/input/FileLocation.h"

#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <filesystem>
#include <system_error>

platform::URLRef fileLocation(const std::string& name)
{
    const std::string path = systemPath(name);
    std::error_code error;
    // Not by way of CFileRef's paths, in which a "~" at the start means a home folder: the shell has read that already.
    const std::string absolute = path.starts_with('/') ? path : std::filesystem::absolute(path, error).string();
    if (error)
        throw Failure(systemErrorText(error.value()));
    platform::URLRef url = platform::URL::createWithFileSystemBytes(absolute, false);
    if (!url)
        throw Failure("its path cannot be a file URL");
    return url;
}
