#include "coordination/KTFileLock.h"

#include "coordination/KTFilePresenterLock.h"

std::shared_ptr<KTFileLock> KTFileLock::lockForURL(const platform::URLRef& url)
{
    return KTFilePresenterLock::lockForURL(url);
}

void KTFileLock::retainLockForURL(const platform::URLRef& url, KTFileLockOptions options)
{
    KTFilePresenterLock::retainLockForURL(url, options);
}

void KTFileLock::releaseLockForURL(const platform::URLRef& url)
{
    KTFilePresenterLock::releaseLockForURL(url);
}

void KTFileLock::removeUnusedLocks()
{
    KTFilePresenterLock::removeUnusedLocks();
}
