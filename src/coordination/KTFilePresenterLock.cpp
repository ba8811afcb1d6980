#include "coordination/KTFilePresenterLock.h"

#include "coordination/LockLog.h"
#include "coordination/LockTable.h"
#include "platform/Log.h"
#include "platform/SecurityScope.h"

using platform::FileCoordinator;

namespace {

LockTable<KTFilePresenterLock>& table()
{
    // Never destroyed: threads may use it after static objects are gone.
    static auto& locks = *new LockTable<KTFilePresenterLock>;
    return locks;
}

platform::AskedBy askedBy(KTFilePresenterLock::LockType type)
{
    switch (type) {
    case KTFilePresenterLock::LockType::readersOnly:
        return platform::AskedBy::readers;
    case KTFilePresenterLock::LockType::writersOnly:
        return platform::AskedBy::writers;
    default:
        return platform::AskedBy::both;
    }
}

} // namespace

KTFilePresenterLock::KTFilePresenterLock(Creation, LockType type, platform::URLRef url)
    : item_(std::move(url)),
      lockType_(type),
      fpQueue_(2) // a parked writer must not keep readers from asking
{
}

KTFilePresenterLock::~KTFilePresenterLock()
{
    FileCoordinator::removeFilePresenter(*this); // while others can still ask it as the lock that it is
}

std::shared_ptr<KTFilePresenterLock> KTFilePresenterLock::initLockWithType(LockType type, platform::URLRef url)
{
    auto lock = std::make_shared<KTFilePresenterLock>(Creation(), type, std::move(url));
    lock->isRegistered_ = FileCoordinator::addFilePresenter(lock, platform::AskedBy::nobody);
    return lock;
}

bool KTFilePresenterLock::isReaderWaiting() const
{
    const std::lock_guard guard(blockCreateLock_);
    return readerAnswer_ != nullptr;
}

bool KTFilePresenterLock::isWriterWaiting() const
{
    const std::lock_guard guard(blockCreateLock_);
    return writerAnswer_ != nullptr;
}

bool KTFilePresenterLock::isInUse() const
{
    const std::lock_guard guard(blockCreateLock_);
    return holders_.isInUse();
}

std::int64_t KTFilePresenterLock::lockCount() const
{
    const std::lock_guard guard(blockCreateLock_);
    return holders_.count();
}

bool KTFilePresenterLock::ignoreSecurityScopedAccess() const
{
    const std::lock_guard guard(blockCreateLock_);
    return ignoreSecurityScopedAccess_;
}

void KTFilePresenterLock::setIgnoreSecurityScopedAccess(bool ignore)
{
    const std::lock_guard guard(blockCreateLock_);
    ignoreSecurityScopedAccess_ = ignore;
}

bool KTFilePresenterLock::requestSecurityScopedURLAccess() const
{
    const std::lock_guard guard(blockCreateLock_);
    return requestSecurityScopedURLAccess_;
}

void KTFilePresenterLock::setRequestSecurityScopedURLAccess(bool request)
{
    const std::lock_guard guard(blockCreateLock_);
    requestSecurityScopedURLAccess_ = request;
}

void KTFilePresenterLock::relinquishPresentedItemToReader(platform::Reacquirer reacquirer)
{
    relinquish(Party::reader, std::move(reacquirer));
}

void KTFilePresenterLock::relinquishPresentedItemToWriter(platform::Reacquirer reacquirer)
{
    relinquish(Party::writer, std::move(reacquirer));
}

/// Keeps the answer for the release while the lock is held, so that no thread waits for it.
void KTFilePresenterLock::relinquish(Party party, platform::Reacquirer reacquirer)
{
    const LockType passes = party == Party::reader ? LockType::writersOnly : LockType::readersOnly;
    {
        const std::lock_guard guard(blockCreateLock_);
        if (holders_.count() > 0 && lockType_ != passes) {
            (party == Party::reader ? readerAnswer_ : writerAnswer_) = std::move(reacquirer);
            return;
        }
    }
    reacquirer();
}

void KTFilePresenterLock::retainLockWithFinishedHandler(KTFileLockHandler handler)
{
    HolderCount::Retained retained;
    {
        const std::lock_guard guard(blockCreateLock_);
        retained = holders_.retain(handler);
        if (retained == HolderCount::Retained::mustAcquire && requestSecurityScopedURLAccess_ && url())
            hasSecurityScope_ = platform::startSecurityScopedAccess(*url());
    }
    if (retained == HolderCount::Retained::held && handler)
        handler();
    if (retained == HolderCount::Retained::mustAcquire &&
        !platform::runInBackground([self = shared_from_this()] { self->acquire(); }))
        fail("no thread");
}

void KTFilePresenterLock::acquire()
{
    platform::Error error;
    const bool isHad = present(&error) && FileCoordinator(shared_from_this())
                                              .coordinateAcquiring(
                                                  item_,
                                                  [this](const auto&) {
                                                      {
                                                          const std::lock_guard guard(blockCreateLock_);
                                                          holders_.acquired();
                                                      }
                                                      holders_.callHandlers(blockCreateLock_);
                                                      const std::lock_guard guard(blockCreateLock_);
                                                      if (holders_.settle())
                                                          becomeIdle();
                                                  },
                                                  &error);
    if (!isHad)
        fail(error.description);
}

/// Makes the lock visible before it is acquired, so that nobody can begin in between without asking.
bool KTFilePresenterLock::present(platform::Error* error)
{
    const std::lock_guard guard(blockCreateLock_);
    if (!isRegistered_)
        isRegistered_ = FileCoordinator::addFilePresenter(shared_from_this(), platform::AskedBy::nobody, error);
    return isRegistered_ && FileCoordinator::setAskedBy(*this, askedBy(lockType_), error);
}

void KTFilePresenterLock::fail(const std::string& reason)
{
    std::vector<KTFileLockHandler> dropped;
    {
        const std::lock_guard guard(blockCreateLock_);
        dropped = holders_.failed();
        becomeIdle();
    }
    platform::logLine("file lock: " + reason);
}

/// Called with the mutex held, once the last holder has left.
void KTFilePresenterLock::becomeIdle()
{
    FileCoordinator::setAskedBy(*this, platform::AskedBy::nobody);
    for (platform::Reacquirer* answer : {&writerAnswer_, &readerAnswer_})
        if (const auto reacquirer = std::exchange(*answer, nullptr))
            reacquirer();
    if (std::exchange(hasSecurityScope_, false))
        platform::stopSecurityScopedAccess(*url());
}

void KTFilePresenterLock::releaseLock()
{
    const std::lock_guard guard(blockCreateLock_);
    if (holders_.release())
        becomeIdle();
}

void KTFilePresenterLock::resetLock()
{
    const std::lock_guard guard(blockCreateLock_);
    if (holders_.reset())
        becomeIdle();
}

void KTFilePresenterLock::unregisterUnlessInUse()
{
    const std::lock_guard guard(blockCreateLock_);
    if (!holders_.isInUse() && std::exchange(isRegistered_, false))
        FileCoordinator::removeFilePresenter(*this);
}

std::shared_ptr<KTFilePresenterLock> KTFilePresenterLock::lockForURL(const platform::URLRef& url)
{
    return table().find(url);
}

std::shared_ptr<KTFilePresenterLock> KTFilePresenterLock::addLockWithType(LockType type, const platform::URLRef& url)
{
    return table().findOrAdd(url, [&] { return initLockWithType(type, url); });
}

void KTFilePresenterLock::retainLockForURL(const platform::URLRef& url, KTFileLockOptions options,
                                           KTFileLockHandler finished)
{
    table().findOrAddAndUse(
        url, [&] { return initLockWithType(LockType::readersAndWriters, url); },
        [&](KTFilePresenterLock& lock) {
            {
                const std::lock_guard guard(lock.blockCreateLock_);
                if (lock.holders_.count() == 0) {
                    lock.requestSecurityScopedURLAccess_ = options.requestSecurityScopedURLAccess;
                    lock.ignoreSecurityScopedAccess_ = options.ignoreSecurityScopedURLAccess;
                }
            }
            lock.retainLockWithFinishedHandler(std::move(finished));
        });
}

void KTFilePresenterLock::releaseLockForURL(const platform::URLRef& url)
{
    if (const auto lock = table().find(url))
        lock->releaseLock();
}

void KTFilePresenterLock::removeLockForURL(const platform::URLRef& url)
{
    if (const auto lock = table().removeUnused(url))
        lock->unregisterUnlessInUse();
}

void KTFilePresenterLock::removeUnusedLocks()
{
    for (const auto& lock : table().removeAllUnused())
        lock->unregisterUnlessInUse();
}

std::string KTFilePresenterLock::_logLocks()
{
    std::string text;
    for (const auto& lock : table().all())
        text += "\nLocked: " + locklog::yesOrNo(lock->isLocking()) +
                " Count: " + locklog::countText(lock->lockCount()) +
                " R: " + locklog::yesOrNo(lock->isReaderWaiting()) +
                " W: " + locklog::yesOrNo(lock->isWriterWaiting()) + " Path: '" + lock->url()->posixPath() + "'";
    return text + "\n";
}
