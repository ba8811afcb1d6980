#include "coordination/KTFileCoordinationLock.h"

#include "coordination/LockLog.h"
#include "coordination/LockTable.h"
#include "platform/Log.h"

using platform::FileCoordinator;

namespace {

LockTable<KTFileCoordinationLock>& table()
{
    // Never destroyed: threads may use it after static objects are gone.
    static auto& locks = *new LockTable<KTFileCoordinationLock>;
    return locks;
}

} // namespace

KTFileCoordinationLock::KTFileCoordinationLock(Creation, LockType type, platform::URLRef url)
    : item_(std::move(url)),
      lockType_(type)
{
}

std::shared_ptr<KTFileCoordinationLock> KTFileCoordinationLock::initLock(LockType type, platform::URLRef url)
{
    return std::make_shared<KTFileCoordinationLock>(Creation(), type, std::move(url));
}

std::shared_ptr<KTFileCoordinationLock> KTFileCoordinationLock::initLockForReadingAtURL(platform::URLRef url)
{
    return initLock(LockType::reading, std::move(url));
}

std::shared_ptr<KTFileCoordinationLock> KTFileCoordinationLock::initLockForWritingAtURL(platform::URLRef url)
{
    return initLock(LockType::writing, std::move(url));
}

std::shared_ptr<KTFileCoordinationLock>
KTFileCoordinationLock::fileCoordinationLockForReadingAtURL(platform::URLRef url)
{
    return initLock(LockType::reading, std::move(url));
}

std::shared_ptr<KTFileCoordinationLock>
KTFileCoordinationLock::fileCoordinationLockForWritingAtURL(platform::URLRef url)
{
    return initLock(LockType::writing, std::move(url));
}

platform::URLRef KTFileCoordinationLock::coordinationBlockURL() const
{
    const std::lock_guard guard(blockCreateLock_);
    return newURL_;
}

bool KTFileCoordinationLock::isInUse() const
{
    const std::lock_guard guard(blockCreateLock_);
    return holders_.isInUse();
}

std::int64_t KTFileCoordinationLock::lockCount() const
{
    const std::lock_guard guard(blockCreateLock_);
    return holders_.count();
}

void KTFileCoordinationLock::retainLockWithFinishedHandler(KTFileLockHandler handler)
{
    HolderCount::Retained retained;
    {
        const std::lock_guard guard(blockCreateLock_);
        retained = holders_.retain(handler);
    }
    if (retained == HolderCount::Retained::held && handler)
        handler();
    if (retained == HolderCount::Retained::mustAcquire &&
        !opQueue_.add([self = shared_from_this()] { self->acquire(); }))
        fail("no thread");
}

void KTFileCoordinationLock::acquire()
{
    platform::Error error;
    const FileCoordinator coordinator;
    auto access = lockType_ == LockType::reading
                      ? coordinator.openForReading(item_, FileCoordinator::ReadingOptions::none, &error)
                      : coordinator.openForWriting(item_, FileCoordinator::WritingOptions::forReplacing, &error);
    if (access)
        hold(std::move(access));
    else
        fail(error.description);
}

/// Access stays open until the last holder leaves, which may be before the handlers have returned.
void KTFileCoordinationLock::hold(std::unique_ptr<platform::CoordinatedAccess> access)
{
    {
        const std::lock_guard guard(blockCreateLock_);
        newURL_ = access->url();
        access_ = std::move(access);
        holders_.acquired();
    }
    holders_.callHandlers(blockCreateLock_);
    {
        const std::lock_guard guard(blockCreateLock_);
        if (holders_.settle())
            access = std::move(access_);
    }
}

void KTFileCoordinationLock::fail(const std::string& reason)
{
    std::vector<KTFileLockHandler> dropped;
    {
        const std::lock_guard guard(blockCreateLock_);
        dropped = holders_.failed();
    }
    platform::logLine("file lock: " + reason);
}

void KTFileCoordinationLock::releaseLock()
{
    std::unique_ptr<platform::CoordinatedAccess> ended; // destroyed outside the mutex
    const std::lock_guard guard(blockCreateLock_);
    if (holders_.release())
        ended = std::move(access_);
}

void KTFileCoordinationLock::resetLock()
{
    std::unique_ptr<platform::CoordinatedAccess> ended;
    const std::lock_guard guard(blockCreateLock_);
    if (holders_.reset())
        ended = std::move(access_);
}

std::shared_ptr<KTFileCoordinationLock> KTFileCoordinationLock::lockForURL(const platform::URLRef& url)
{
    return table().find(url);
}

std::shared_ptr<KTFileCoordinationLock> KTFileCoordinationLock::addLockForReadingAtURL(const platform::URLRef& url)
{
    return table().findOrAdd(url, [&] { return initLock(LockType::reading, url); });
}

std::shared_ptr<KTFileCoordinationLock> KTFileCoordinationLock::addLockForWritingAtURL(const platform::URLRef& url)
{
    return table().findOrAdd(url, [&] { return initLock(LockType::writing, url); });
}

void KTFileCoordinationLock::retainWriteLockForURL(const platform::URLRef& url, KTFileLockHandler finished)
{
    table().findOrAddAndUse(
        url, [&] { return initLock(LockType::writing, url); },
        [&](KTFileCoordinationLock& lock) { lock.retainLockWithFinishedHandler(std::move(finished)); });
}

void KTFileCoordinationLock::releaseWriteLockForURL(const platform::URLRef& url)
{
    if (const auto lock = table().find(url))
        lock->releaseLock();
}

void KTFileCoordinationLock::removeLockForURL(const platform::URLRef& url)
{
    table().removeUnused(url);
}

std::string KTFileCoordinationLock::_logLocks()
{
    std::string text;
    for (const auto& lock : table().all())
        text += "\nLocked: " + locklog::yesOrNo(lock->isLocking()) +
                " Count: " + locklog::countText(lock->lockCount()) + " Path: '" + lock->url()->posixPath() + "'";
    return text + "\n";
}
