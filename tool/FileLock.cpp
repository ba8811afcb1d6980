#include "FileLock.h"

#include <cerrno>
#include <fcntl.h>
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

bool waitForLock(int descriptor)
{
    return lockWhole(descriptor, F_OFD_SETLKW) == 0;
}
