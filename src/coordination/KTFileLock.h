// The base of the locks that keep other processes from reading or rewriting a file which stays open here for long.
#pragma once

#include "platform/FileCoordination.h"

#include <cstdint>
#include <functional>
#include <memory>

/// Called once the lock is held, in the order of the retains: on the caller's thread when the lock is held and no
/// earlier handler waits, else inside the coordinated access that takes the lock, on its thread. It may retain and
/// release; an access of its own to the same file would wait for itself.
using KTFileLockHandler = std::function<void()>;

/// How a lock treats sandboxed access; both are without effect on Linux.
struct KTFileLockOptions {
    bool requestSecurityScopedURLAccess = false; // ask for access along with the lock
    bool ignoreSecurityScopedURLAccess = false;  // do not ask, whatever the URL carries
};

/// A lock that counts its holders and is held while it has any. The static functions are those of
/// KTFilePresenterLock.
class KT_EXPORT KTFileLock {
public:
    virtual ~KTFileLock() = default;

    /// Whether the lock is held.
    virtual bool isLocking() const { return false; }
    /// How many holders a held lock has; 0 when it is not held.
    virtual std::int64_t lockCount() const { return 0; }
    /// Releases a held lock fully, whatever its count.
    virtual void resetLock() {}

    /// `lockForURL:`: the registered lock of the file; null for none.
    static std::shared_ptr<KTFileLock> lockForURL(const platform::URLRef& url);
    /// `retainLockForURL:`, `retainLockForURL:requestSecurityScopedURLAccess:`,
    /// `retainLockForURL:ignoreSecurityScopedURLAccess:`: adds a holder to the file's lock, which is made when there
    /// is none.
    static void retainLockForURL(const platform::URLRef& url, KTFileLockOptions options = {});
    /// `releaseLockForURL:`: removes a holder.
    static void releaseLockForURL(const platform::URLRef& url);
    /// `removeUnusedLocks`: forgets all locks that are not in use.
    static void removeUnusedLocks();
};
