// A lock that keeps one coordinated access open for as long as it is held.
#pragma once

#include "coordination/HolderCount.h"
#include "coordination/KTFileLock.h"

#include <mutex>
#include <string>

/// One coordinated access, open while the lock is held. Owned by shared pointers only, of which running work has one.
/// Any thread may use it.
class KT_EXPORT KTFileCoordinationLock final : public KTFileLock,
                                               public std::enable_shared_from_this<KTFileCoordinationLock> {
public:
    /// The access that is held.
    enum class LockType : std::uint64_t { reading = 0, writing = 1 };

    /// `initLock:atURL:`, `initLockForReadingAtURL:`, `initLockForWritingAtURL:`: a lock that is in no table.
    static std::shared_ptr<KTFileCoordinationLock> initLock(LockType type, platform::URLRef url);
    /// The same, for reading.
    static std::shared_ptr<KTFileCoordinationLock> initLockForReadingAtURL(platform::URLRef url);
    /// The same, for writing.
    static std::shared_ptr<KTFileCoordinationLock> initLockForWritingAtURL(platform::URLRef url);
    /// The same as initLockForReadingAtURL().
    static std::shared_ptr<KTFileCoordinationLock> fileCoordinationLockForReadingAtURL(platform::URLRef url);
    /// The same as initLockForWritingAtURL().
    static std::shared_ptr<KTFileCoordinationLock> fileCoordinationLockForWritingAtURL(platform::URLRef url);

    /// The file, as it was given.
    const platform::URLRef& url() const { return item_.url(); }
    /// The URL to use for the file while the lock is held; null before it was first held.
    platform::URLRef coordinationBlockURL() const;
    /// The access that is held.
    LockType lockType() const { return lockType_; }
    bool isLocking() const override { return lockCount() > 0; }
    /// Whether the lock is held or being acquired.
    bool isInUse() const;
    /// Adds a holder. Does nothing at 2^63 - 1 holders. When the system refuses coordinated access, no handler is
    /// called and the lock is idle again.
    void retainLockWithFinishedHandler(KTFileLockHandler handler);
    /// Removes a holder; the last one ends the access.
    void releaseLock();
    void resetLock() override;
    /// How many holders a held lock has; 0 when it is not held.
    std::int64_t lockCount() const override;

    /// The registered lock of a file; null for none.
    static std::shared_ptr<KTFileCoordinationLock> lockForURL(const platform::URLRef& url);
    /// The registered lock of a file, whatever its type, or a new one; null for a URL without a path.
    static std::shared_ptr<KTFileCoordinationLock> addLockForReadingAtURL(const platform::URLRef& url);
    /// The same; a new one is for writing.
    static std::shared_ptr<KTFileCoordinationLock> addLockForWritingAtURL(const platform::URLRef& url);
    /// `retainWriteLockForURL:`, `retainWriteLockForURL:withFinishedHandler:`: adds a holder to the file's lock,
    /// which is made for writing when there is none.
    static void retainWriteLockForURL(const platform::URLRef& url, KTFileLockHandler finished = {});
    /// Removes a holder of the file's lock, if there is one.
    static void releaseWriteLockForURL(const platform::URLRef& url);
    /// Forgets the file's lock, unless it is in use.
    static void removeLockForURL(const platform::URLRef& url);
    /// A line for each registered lock, for people.
    static std::string _logLocks();

private:
    struct Creation {
        explicit Creation() = default;
    };

public:
    /// For the factories; use those.
    KTFileCoordinationLock(Creation, LockType type, platform::URLRef url);

private:
    void acquire();
    void hold(std::unique_ptr<platform::CoordinatedAccess> access);
    void fail(const std::string& reason);

    const platform::CoordinatedItem item_;
    const LockType lockType_;
    platform::OperationQueue opQueue_;
    mutable std::mutex blockCreateLock_; // guards everything below
    HolderCount holders_;
    std::unique_ptr<platform::CoordinatedAccess> access_; // while it is held
    platform::URLRef newURL_;
};
