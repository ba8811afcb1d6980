#include "tool/shared/input/FileVersion.h"

#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>
#include <sys/stat.h>

namespace {

std::int64_t nanoseconds(const timespec& time)
{
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

} // namespace

FileVersion versionOf(const std::string& path)
{
    struct stat status = {};
    if (::stat(systemPath(path).c_str(), &status) != 0)
        throw Failure(SystemErrorText(errno));
    return {status.st_dev, status.st_ino, status.st_size, nanoseconds(status.st_mtim), nanoseconds(status.st_ctim)};
}
