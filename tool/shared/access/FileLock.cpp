#include "tool/shared/access/FileLock.h"

#include "tool/shared/access/Descriptor.h"
#include "tool/shared/access/Parties.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>
#include <fcntl.h>
#include <memory>
#include <unistd.h>

namespace {

// Locks of the open file description: the library opens and closes the same file, and that would drop a process's lock.
int lockWhole(int descriptor, int command)
{
    struct flock whole = {};
    whole.l_type = F_WRLCK;
    whole.l_whence = SEEK_SET;
    int result = 0;
    do
        result = ::fcntl(descriptor, command, &whole);
    while (result != 0 && errno == EINTR);
    return result;
}

} // namespace

LockResult tryLock(int descriptor)
{
    if (lockWhole(descriptor, F_OFD_SETLK) == 0)
        return LockResult::locked;
    return errno == EAGAIN || errno == EACCES ? LockResult::busy : LockResult::unsupported;
}

bool waitForLock(int descriptor, const std::string& path, const WaitOptions& wait)
{
    if (const LockResult result = tryLock(descriptor); result != LockResult::busy)
        return result == LockResult::locked;
    // The lock is the open file's: had too late it goes with the last of its descriptors, which is this copy.
    const auto copy = std::make_shared<Descriptor>(::fcntl(descriptor, F_DUPFD_CLOEXEC, 0));
    if (!*copy)
        throw Failure(systemErrorText(errno));
    const auto result = std::make_shared<int>(-1);
    awaitOthers(
        path, wait, [&] { return lockersText(descriptor); },
        [copy, result] { *result = lockWhole(copy->get(), F_OFD_SETLKW); });
    return *result == 0;
}
