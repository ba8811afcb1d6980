#include "platform/Volumes.h"

#include "platform/posix/MountTable.h"

#include <algorithm>
#include <cerrno>
#include <string_view>

#include <sys/statvfs.h>

namespace platform {

namespace {

constexpr std::string_view kNetworkFileSystems[] = {
    "nfs",
    "nfs4",
    "cifs",
    "smb3",
    "smbfs",
    "afs",
    "ncpfs",
    "coda",
    "9p",
    "ceph",
    "lustre",
    "glusterfs",
    "ocfs2",
    "gfs2",
    "beegfs",
    "davfs",
    "fuse.sshfs",
    "fuse.davfs",
    "fuse.davfs2",
    "fuse.smbnetfs",
    "fuse.glusterfs",
    "fuse.rclone",
    "fuse.s3fs",
    "fuse.curlftpfs",
    "fuse.gvfsd-fuse",
    "fuse.ceph",
    "fuse.ceph-fuse",
};

std::optional<struct statvfs> volumeStatus(const char* path)
{
    struct statvfs status = {};
    return ::statvfs(path, &status) == 0 ? std::optional(status) : std::nullopt;
}

} // namespace

std::optional<bool> volumeIsReadOnly(const char* path)
{
    const auto status = volumeStatus(path);
    return status ? std::optional((status->f_flag & ST_RDONLY) != 0) : std::nullopt;
}

std::optional<bool> volumeIsLocal(const char* path)
{
    const auto mount = mountOf(path);
    return mount ? std::optional(!isNetworkFileSystem(mount->fileSystem)) : std::nullopt;
}

std::optional<VolumeSpace> volumeSpace(const char* path)
{
    const auto status = volumeStatus(path);
    VolumeSpace space;
    // Some virtual file systems claim more space than 64 bits can count.
    if (!status || __builtin_mul_overflow(status->f_bavail, status->f_frsize, &space.free) ||
        __builtin_mul_overflow(status->f_blocks, status->f_frsize, &space.total))
        return std::nullopt;
    return space;
}

bool isNetworkFileSystem(const std::string& name)
{
    return std::find(std::begin(kNetworkFileSystems), std::end(kNetworkFileSystems), name) !=
           std::end(kNetworkFileSystems);
}

} // namespace platform
