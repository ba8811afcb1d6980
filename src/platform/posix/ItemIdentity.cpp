#include "platform/posix/ItemIdentity.h"

#include "platform/posix/ItemKind.h"

#include <cstddef>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <sys/sysmacros.h>

namespace platform {

namespace {

void readHandle(const char* path, ItemIdentity& identity)
{
    // The kernel's struct ends in an array of variable length, for which the bytes behind it are reserved.
    alignas(file_handle) std::byte storage[sizeof(file_handle) + MAX_HANDLE_SZ] = {};
    auto* handle = reinterpret_cast<file_handle*>(storage);
    handle->handle_bytes = MAX_HANDLE_SZ;
    int mount = 0;
    if (name_to_handle_at(AT_FDCWD, path, handle, &mount, 0) != 0 || handle->handle_bytes > MAX_HANDLE_SZ)
        return;
    const std::byte* bytes = storage + offsetof(file_handle, f_handle);
    identity.handleType = handle->handle_type;
    identity.handle.assign(bytes, bytes + handle->handle_bytes);
}

} // namespace

std::optional<ItemIdentity> itemIdentity(const char* path)
{
    struct statx found = {};
    if (statx(AT_FDCWD, path, AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT, STATX_TYPE | STATX_INO | STATX_BTIME, &found) != 0)
        return std::nullopt;
    ItemIdentity identity;
    identity.kind = kindOfMode(found.stx_mode);
    identity.device = makedev(found.stx_dev_major, found.stx_dev_minor);
    identity.inode = found.stx_ino;
    if ((found.stx_mask & STATX_BTIME) != 0) {
        identity.birthSeconds = found.stx_btime.tv_sec;
        identity.birthNanoseconds = found.stx_btime.tv_nsec;
    }
    readHandle(path, identity);
    return identity;
}

bool contradict(const ItemIdentity& a, const ItemIdentity& b)
{
    if (a.inode != b.inode)
        return true;
    if (a.hasBirthTime() && b.hasBirthTime() &&
        (a.birthSeconds != b.birthSeconds || a.birthNanoseconds != b.birthNanoseconds))
        return true;
    return !a.handle.empty() && !b.handle.empty() && (a.handleType != b.handleType || a.handle != b.handle);
}

bool provenSame(const ItemIdentity& a, const ItemIdentity& b)
{
    const bool comparable = (a.hasBirthTime() && b.hasBirthTime()) || (!a.handle.empty() && !b.handle.empty());
    return comparable && !contradict(a, b);
}

std::uint64_t fileSystemIdentifier(const char* path)
{
    struct statvfs found = {};
    return statvfs(path, &found) == 0 ? found.f_fsid : 0;
}

} // namespace platform
