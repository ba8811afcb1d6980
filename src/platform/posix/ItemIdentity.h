// What tells one item of a file system from every other, the later users of its inode number included.
#pragma once

#include "platform/SystemCalls.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace platform {

/// Inode numbers are used again once their item is gone; the birth time and the bytes of the kernel's file handle
/// (which hold the inode's generation) are not. File systems have both, one of them, or none.
struct ItemIdentity {
    FileKind kind = FileKind::other;
    std::uint64_t device = 0; // as numbered since the system started
    std::uint64_t inode = 0;
    std::int64_t birthSeconds = 0; // since 1970; both parts zero: not known
    std::uint32_t birthNanoseconds = 0;
    std::int32_t handleType = 0;
    std::vector<std::byte> handle; // empty: not known

    bool hasBirthTime() const { return birthSeconds != 0 || birthNanoseconds != 0; }
};

/// Of the item at a path, a symbolic link being an item; null, with errno, when there is none.
std::optional<ItemIdentity> itemIdentity(const char* path);

/// Whether something that both have is different.
bool contradict(const ItemIdentity& a, const ItemIdentity& b);
/// Whether nothing is different and there is more than the inode number to show it.
bool provenSame(const ItemIdentity& a, const ItemIdentity& b);

/// The number by which a file system knows itself again, also after a restart; 0 when it is not to be had.
std::uint64_t fileSystemIdentifier(const char* path);

} // namespace platform
