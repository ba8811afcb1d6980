// Locks on byte ranges that belong to an open file description. The kernel drops them when its last descriptor is
// closed, also for a process that is killed. The bytes need not exist.
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

/// Locks the whole range or nothing; false if another description's lock is in the way. Retries after signals. Throws
/// std::system_error for any other failure, as the others do (ENOLCK: the kernel has no memory for locks).
bool tryLock(int descriptor, ByteRange range, LockKind kind);
/// Waits until the whole range is locked.
void waitForLock(int descriptor, ByteRange range, LockKind kind);
void unlock(int descriptor, ByteRange range);
/// Some exclusive lock of another description in the range, not necessarily the first; none if there is none.
std::optional<ByteRange> findExclusiveLock(int descriptor, ByteRange range);

/// The system call behind all of these: fcntl with a `struct flock`. Only tests assign to it.
using LockCall = int (*)(int descriptor, int command, void* lock);
LockCall& lockCall();

} // namespace platform
