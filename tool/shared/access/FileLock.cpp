#include "tool/shared/access/FileLock.h"

#include "platform/FileLock.h"
#include "platform/OwnedDescriptor.h"
#include "tool/shared/access/Parties.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>
#include <fcntl.h>
#include <memory>

using platform::FileLockResult;

bool waitForLock(int descriptor, const std::string& path, const WaitOptions& wait)
{
    if (const FileLockResult result = platform::tryToLockFile(descriptor); result != FileLockResult::busy)
        return result == FileLockResult::locked;
    // The lock belongs to the open file. If it is acquired too late, it is released with its last descriptor, this
    // copy.
    const auto copy = std::make_shared<platform::OwnedDescriptor>(::fcntl(descriptor, F_DUPFD_CLOEXEC, 0));
    if (!*copy)
        throw Failure(SystemErrorText(errno));
    const auto result = std::make_shared<FileLockResult>(FileLockResult::unsupported);
    awaitOthers(
        path, wait, [&] { return lockersText(descriptor); },
        [copy, result] { *result = platform::waitToLockFile(copy->get()); });
    return *result == FileLockResult::locked;
}
