// The base of the locks that keep other processes from reading or rewriting a file that is open here for a long time.
#pragma once

#include "platform/FileCoordination.h"

#include <cstdint>
#include <functional>
#include <memory>

/// Called once the lock is held, in the order of the retains: at once on the caller's thread when the lock was held and
/// nobody before is still to be called, else inside the coordinated access that took the lock, on its thread. It may
/// retain and release; an access of its own to the same file would wait for itself.
using KTFileLockHandler = std::function<void()>;

struct KTFileLockOptions {
    bool requestSecurityScopedURLAccess = false;
    bool ignoreSecurityScopedURLAccess = false;
};

/// Counts its holders; the lock is held while there are any. The class operations are those of KTFilePresenterLock.
class KT_EXPORT KTFileLock {
public:
    virtual ~KTFileLock() = default;

    virtual bool isLocking() const { return false; }
    virtual std::int64_t lockCount() const { return 0; }
    /// Releases a held lock fully, whatever its count.
    virtual void resetLock() {}

    /// `lockForURL:` The registered lock of the file, or null.
    static std::shared_ptr<KTFileLock> lockForURL(const platform::URLRef& url);
    /// `retainLockForURL:`, `retainLockForURL:requestSecurityScopedURLAccess:`,
    /// `retainLockForURL:ignoreSecurityScopedURLAccess:`
    static void retainLockForURL(const platform::URLRef& url, KTFileLockOptions options = {});
    /// `releaseLockForURL:`
    static void releaseLockForURL(const platform::URLRef& url);
    /// `removeUnusedLocks`
    static void removeUnusedLocks();
};
