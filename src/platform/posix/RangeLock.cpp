#include "platform/posix/RangeLock.h"

#include <cerrno>
#include <system_error>

#include <fcntl.h>

namespace platform {

namespace {

int systemLockCall(int descriptor, int command, void* lock)
{
    return ::fcntl(descriptor, command, lock);
}

struct flock requestFor(ByteRange range, int type)
{
    struct flock request = {}; // l_pid must be 0
    request.l_type = static_cast<short>(type);
    request.l_whence = SEEK_SET;
    request.l_start = range.start;
    request.l_len = range.length;
    return request;
}

/// False if the lock is taken by another.
bool call(int descriptor, int command, struct flock& request)
{
    for (;;) {
        if (lockCall()(descriptor, command, &request) == 0)
            return true;
        if (errno == EAGAIN || errno == EACCES)
            return false;
        if (errno != EINTR)
            throw std::system_error(errno, std::generic_category(), "coordination lock");
    }
}

int typeOf(LockKind kind)
{
    return kind == LockKind::shared ? F_RDLCK : F_WRLCK;
}

} // namespace

LockCall& lockCall()
{
    static LockCall current = systemLockCall;
    return current;
}

bool tryLock(int descriptor, ByteRange range, LockKind kind)
{
    struct flock request = requestFor(range, typeOf(kind));
    return call(descriptor, F_OFD_SETLK, request);
}

void waitForLock(int descriptor, ByteRange range, LockKind kind)
{
    struct flock request = requestFor(range, typeOf(kind));
    while (!call(descriptor, F_OFD_SETLKW, request)) {
    }
}

void unlock(int descriptor, ByteRange range)
{
    struct flock request = requestFor(range, F_UNLCK);
    call(descriptor, F_OFD_SETLK, request);
}

std::optional<ByteRange> findExclusiveLock(int descriptor, ByteRange range)
{
    struct flock request = requestFor(range, F_RDLCK); // conflicts with exclusive locks only
    call(descriptor, F_OFD_GETLK, request);
    if (request.l_type == F_UNLCK)
        return std::nullopt;
    return ByteRange{request.l_start, request.l_len};
}

} // namespace platform
