#include "platform/FileSystem.h"

#include "platform/core/ASCIICase.h"
#include "platform/core/ByteWriter.h"
#include "platform/posix/AbsolutePath.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace platform {

namespace {

/// The extensions of the suite's project packages, including the old kinds.
constexpr std::string_view kPackageExtensions[] = {"fuguex", "band", "concert", "grid", "mwand"};

} // namespace

std::shared_ptr<const Bytes> volumeIdentifier(const URL& url)
{
    const std::string& path = absolutePath(url);
    unsigned wanted = STATX_BASIC_STATS;
#ifdef STATX_MNT_ID
    wanted |= STATX_MNT_ID;
#endif
    struct statx found = {};
    if (path.empty() || statx(AT_FDCWD, path.c_str(), AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT, wanted, &found) != 0)
        return nullptr;

    // The mount's number, if the kernel tells it. A file can be renamed only within its mount, while overlay file
    // systems give files of one mount different devices.
    ByteWriter writer;
#ifdef STATX_MNT_ID
    if ((found.stx_mask & STATX_MNT_ID) != 0)
        writer.write(std::uint64_t{found.stx_mnt_id});
#endif
    if (writer.size() == 0) {
        writer.write(std::uint32_t{found.stx_dev_major});
        writer.write(std::uint32_t{found.stx_dev_minor});
    }
    return std::make_shared<const Bytes>(writer.take());
}

bool isFilePackage(const String& path)
{
    const std::string_view text = path.utf8();
    const std::string_view name = text.substr(text.rfind('/') + 1);
    const std::size_t dot = name.rfind('.');
    if (dot == name.npos || dot == 0)
        return false;
    for (const std::string_view extension : kPackageExtensions) {
        FileStatus status;
        if (equalIgnoringASCIICase(name.substr(dot + 1), extension))
            return systemCalls().pathStatus(path.utf8().c_str(), &status) && status.kind == FileKind::directory;
    }
    return false;
}

bool isWritable(const char* path)
{
    return path != nullptr && ::faccessat(AT_FDCWD, path, W_OK, AT_EACCESS) == 0;
}

} // namespace platform
