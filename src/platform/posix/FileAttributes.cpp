#include "platform/FileAttributes.h"

#include <cerrno>
#include <cstring>
#include <vector>

#include <fcntl.h>
#include <linux/limits.h>
#include <sys/stat.h>
#include <sys/xattr.h>

namespace platform {

namespace {

FileTime timeOf(const timespec& time)
{
    return {time.tv_sec, static_cast<std::uint32_t>(time.tv_nsec)};
}

timespec systemTime(const FileTime& time)
{
    timespec converted = {};
    converted.tv_sec = time.seconds;
    converted.tv_nsec = time.nanoseconds;
    return converted;
}

// The system's own attributes are there already, or cannot be set by us.
bool isOurs(const char* name)
{
    return std::strncmp(name, "user.", 5) == 0 || std::strncmp(name, "system.posix_acl_", 17) == 0;
}

} // namespace

bool fileAttributes(int descriptor, FileAttributes& attributes)
{
    struct stat status = {};
    if (::fstat(descriptor, &status) != 0)
        return false;
    attributes = {status.st_uid, status.st_gid, status.st_mode & 07777, timeOf(status.st_atim), timeOf(status.st_mtim)};
    return true;
}

bool setPermissions(int descriptor, std::uint32_t permissions)
{
    return ::fchmod(descriptor, static_cast<mode_t>(permissions)) == 0;
}

bool setFileTimes(int descriptor, const FileTime& accessed, const FileTime* modified)
{
    const timespec stamps[2] = {systemTime(accessed), modified ? systemTime(*modified) : timespec{0, UTIME_NOW}};
    return ::futimens(descriptor, stamps) == 0;
}

bool copyExtendedAttributes(int from, int to, std::string& lost)
{
    lost.clear();
    std::vector<char> names(XATTR_LIST_MAX), value(XATTR_SIZE_MAX);
    const ssize_t length = ::flistxattr(from, names.data(), names.size());
    if (length < 0)
        return errno == ENOTSUP;
    for (const char* name = names.data(); name < names.data() + length; name += std::strlen(name) + 1) {
        const ssize_t size = ::fgetxattr(from, name, value.data(), value.size());
        const bool kept = size >= 0 && ::fsetxattr(to, name, value.data(), static_cast<std::size_t>(size), 0) == 0;
        if (!kept && isOurs(name)) {
            lost = name;
            return false;
        }
    }
    return true;
}

} // namespace platform
