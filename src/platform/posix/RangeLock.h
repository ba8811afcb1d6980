// Locks on ranges of bytes, owned by an open file description: the kernel drops them when its last descriptor is
// closed, which it does itself for a process that is killed. The bytes need not exist.
#pragma once

#include <cstdint>
#include <optional>

namespace platform {

struct ByteRange {
    std::int64_t start;
    std::int64_t length;

    std::int64_t end() const { return start + length; }
};

enum class LockKind { shared, exclusive };

/// Takes the whole range or nothing; false when another description's lock is in the way. Interrupting signals do not
/// show. Throws std::system_error for any other failure (ENOLCK: the kernel has no memory for locks), as the others do.
bool tryLock(int descriptor, ByteRange range, LockKind kind);
/// Waits until the whole range is had.
void waitForLock(int descriptor, ByteRange range, LockKind kind);
void unlock(int descriptor, ByteRange range);
/// Some exclusive lock of another description in the range, not always the first; none when there is none.
std::optional<ByteRange> findExclusiveLock(int descriptor, ByteRange range);

/// The system's call behind all of these: fcntl with a `struct flock`. Only tests assign to it.
using LockCall = int (*)(int descriptor, int command, void* lock);
LockCall& lockCall();

} // namespace platform
