#include "platform/FileLock.h"

#include "platform/posix/RangeLock.h"

#include <system_error>

namespace platform {

namespace {

constexpr ByteRange kWhole{0, 0}; // to the end of the file

} // namespace

FileLockResult tryToLockFile(int descriptor)
try {
    return tryLock(descriptor, kWhole, LockKind::exclusive) ? FileLockResult::locked : FileLockResult::busy;
} catch (const std::system_error&) {
    return FileLockResult::unsupported;
}

FileLockResult waitToLockFile(int descriptor)
try {
    waitForLock(descriptor, kWhole, LockKind::exclusive);
    return FileLockResult::locked;
} catch (const std::system_error&) {
    return FileLockResult::unsupported;
}

} // namespace platform
