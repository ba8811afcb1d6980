#include "platform/FileSystem.h"

#include "platform/posix/ItemSearch.h"

#include <algorithm>
#include <climits>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace platform {

namespace {

/// The block's content in host order, since it never leaves the process. The inode of a block in use is never zero.
struct HandleLayout {
    std::uint64_t device;           //  0
    std::uint64_t inode;            //  8
    std::int64_t birthSeconds;      // 16
    std::uint32_t birthNanoseconds; // 24
    std::int32_t handleType;        // 28
    std::uint32_t handleSize;       // 32  0: not known, or longer than the array
    std::array<std::byte, 28> handle;
    std::array<char, PATH_MAX> path; // 64  NUL-terminated
};
static_assert(sizeof(HandleLayout) == sizeof(FileHandle::bytes) && offsetof(HandleLayout, path) == 64);

std::optional<HandleLayout> layoutOf(const FileHandle& block)
{
    HandleLayout layout;
    std::memcpy(&layout, block.bytes.data(), sizeof layout);
    layout.path.back() = '\0';
    if (layout.inode == 0 || layout.handleSize > layout.handle.size() || layout.path[0] != '/')
        return std::nullopt;
    return layout;
}

ItemIdentity identityOf(const HandleLayout& layout)
{
    ItemIdentity identity;
    identity.device = layout.device;
    identity.inode = layout.inode;
    identity.birthSeconds = layout.birthSeconds;
    identity.birthNanoseconds = layout.birthNanoseconds;
    identity.handleType = layout.handleType;
    identity.handle.assign(layout.handle.begin(), layout.handle.begin() + layout.handleSize);
    return identity;
}

/// The path at which the handle's item now is, within its former folder; null if it is not there.
std::optional<std::string> currentPath(const FileHandle& block)
{
    const std::optional<HandleLayout> layout = layoutOf(block);
    if (!layout)
        return std::nullopt;
    const ItemIdentity wanted = identityOf(*layout);
    const std::string path = layout->path.data();
    const std::optional<ItemIdentity> atPath = itemIdentity(path.c_str());
    if (atPath && atPath->device == wanted.device && !contradict(*atPath, wanted))
        return path;
    const std::string folder = path.substr(0, std::max<std::size_t>(path.rfind('/'), 1));
    return findItem(wanted, {folder}, SearchDepth::folderOnly, SIZE_MAX);
}

} // namespace

bool makeFileHandle(const char* path, FileHandle& handle)
{
    handle = {};
    if (path == nullptr || path[0] != '/' || std::strlen(path) >= PATH_MAX)
        return false;
    const std::optional<ItemIdentity> identity = itemIdentity(path);
    if (!identity || identity->inode == 0)
        return false;

    HandleLayout layout = {};
    layout.device = identity->device;
    layout.inode = identity->inode;
    layout.birthSeconds = identity->birthSeconds;
    layout.birthNanoseconds = identity->birthNanoseconds;
    if (identity->handle.size() <= layout.handle.size()) {
        layout.handleType = identity->handleType;
        layout.handleSize = static_cast<std::uint32_t>(identity->handle.size());
        std::copy(identity->handle.begin(), identity->handle.end(), layout.handle.begin());
    }
    std::strcpy(layout.path.data(), path);
    std::memcpy(handle.bytes.data(), &layout, sizeof layout);
    return true;
}

URLRef urlFromFileHandle(const FileHandle& handle)
{
    const std::optional<std::string> path = currentPath(handle);
    FileStatus status;
    if (!path || !systemCalls().linkStatus(path->c_str(), &status))
        return nullptr;
    return URL::createWithFileSystemPath(String::fromUTF8(*path), PathStyle::posix, status.kind == FileKind::directory);
}

String catalogName(const FileHandle& handle)
{
    const std::optional<std::string> path = currentPath(handle);
    return path ? String::fromUTF8(*path == "/" ? *path : path->substr(path->rfind('/') + 1)) : nullptr;
}

} // namespace platform
