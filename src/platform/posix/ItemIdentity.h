// What distinguishes an item of a file system from every other, including later users of its inode number.
#pragma once

#include "platform/SystemCalls.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace platform {

/// Inode numbers are reused once an item is gone; birth times and the bytes of the kernel's file handle, which include
/// the inode's generation, are not. A file system has both, one of them, or neither.
struct ItemIdentity {
    FileKind kind = FileKind::other;
    std::uint64_t device = 0; // valid until the system restarts
    std::uint64_t inode = 0;
    std::int64_t birthSeconds = 0; // since 1970; unknown if both parts are zero
    std::uint32_t birthNanoseconds = 0;
    std::int32_t handleType = 0;
    std::vector<std::byte> handle; // empty if unknown

    bool hasBirthTime() const { return birthSeconds != 0 || birthNanoseconds != 0; }
};

/// The identity of the item at a path, which may be a symbolic link; null, with errno, if there is none.
std::optional<ItemIdentity> itemIdentity(const char* path);

/// Whether a part that both have differs.
bool contradict(const ItemIdentity& a, const ItemIdentity& b);
/// Whether nothing differs and more than the inode number agrees.
bool provenSame(const ItemIdentity& a, const ItemIdentity& b);

/// File-system id that survives a reboot; 0 if unavailable.
std::uint64_t fileSystemIdentifier(const char* path);

} // namespace platform
