// A lock that keeps one coordinated access open for as long as it is held.
#pragma once

#include "coordination/HolderCount.h"
#include "coordination/KTFileLock.h"

#include <mutex>
#include <string>

/// Owned by shared pointers only; whatever is under way has a share. Any thread may use it.
class KT_EXPORT KTFileCoordinationLock final : public KTFileLock,
                                               public std::enable_shared_from_this<KTFileCoordinationLock> {
public:
    enum class LockType : std::uint64_t { reading = 0, writing = 1 };

    /// `initLock:atURL:`, `initLockForReadingAtURL:`, `initLockForWritingAtURL:` One that is in no table.
    static std::shared_ptr<KTFileCoordinationLock> initLock(LockType type, platform::URLRef url);
    static std::shared_ptr<KTFileCoordinationLock> initLockForReadingAtURL(platform::URLRef url);
    static std::shared_ptr<KTFileCoordinationLock> initLockForWritingAtURL(platform::URLRef url);
    /// The same.
    static std::shared_ptr<KTFileCoordinationLock> fileCoordinationLockForReadingAtURL(platform::URLRef url);
    static std::shared_ptr<KTFileCoordinationLock> fileCoordinationLockForWritingAtURL(platform::URLRef url);

    const platform::URLRef& url() const { return item_.url(); }
    /// The URL to use for the file while the lock is held; null before it was first held.
    platform::URLRef coordinationBlockURL() const;
    LockType lockType() const { return lockType_; }
    bool isLocking() const override { return lockCount() > 0; }
    /// Whether it is held or being acquired.
    bool isInUse() const;
    /// Does nothing at 2^63 - 1 holders. When the system refuses coordinated access, no handler is called and the lock
    /// is idle again.
    void retainLockWithFinishedHandler(KTFileLockHandler handler);
    void releaseLock();
    void resetLock() override;
    std::int64_t lockCount() const override;

    static std::shared_ptr<KTFileCoordinationLock> lockForURL(const platform::URLRef& url);
    /// The file's registered lock, whatever its type, or a new one; null for a URL without a path.
    static std::shared_ptr<KTFileCoordinationLock> addLockForReadingAtURL(const platform::URLRef& url);
    static std::shared_ptr<KTFileCoordinationLock> addLockForWritingAtURL(const platform::URLRef& url);
    /// `retainWriteLockForURL:`, `retainWriteLockForURL:withFinishedHandler:`
    static void retainWriteLockForURL(const platform::URLRef& url, KTFileLockHandler finished = {});
    static void releaseWriteLockForURL(const platform::URLRef& url);
    static void removeLockForURL(const platform::URLRef& url);
    /// A line for each registered lock, for people.
    static std::string _logLocks();

private:
    struct Creation {
        explicit Creation() = default;
    };

public:
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
