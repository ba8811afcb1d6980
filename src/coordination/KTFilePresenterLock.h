// A lock that presents its file, and makes other parties' coordinated access wait while it is held.
#pragma once

#include "coordination/HolderCount.h"
#include "coordination/KTFileLock.h"

#include <mutex>
#include <string>

/// Acquired by a coordinated write, so that earlier accesses have ended; from then on it makes others wait by not
/// answering them. Owned by shared pointers only: the table, callers and running work have one each. Any thread may
/// use it.
class KT_EXPORT KTFilePresenterLock final : public KTFileLock,
                                            public platform::FilePresenter,
                                            public std::enable_shared_from_this<KTFilePresenterLock> {
public:
    /// Whose coordinated access waits while the lock is held.
    enum class LockType : std::uint64_t { readersAndWriters = 0, readersOnly = 1, writersOnly = 2 };

    /// `initLockWithType:forURL:`: a lock that registers as a presenter at once, though others ask it only while it
    /// is held or being acquired. A lock whose URL cannot be presented (null, or without a path) can never be
    /// acquired.
    static std::shared_ptr<KTFilePresenterLock> initLockWithType(LockType type, platform::URLRef url);
    ~KTFilePresenterLock() override;

    /// The file, as it was given.
    const platform::URLRef& url() const { return item_.url(); }
    platform::URLRef presentedItemURL() const override { return url(); }
    platform::OperationQueue& presentedItemOperationQueue() override { return fpQueue_; }
    void relinquishPresentedItemToReader(platform::Reacquirer reacquirer) override;
    void relinquishPresentedItemToWriter(platform::Reacquirer reacquirer) override;

    /// Whether a reader of another party waits for this lock.
    bool isReaderWaiting() const;
    /// Whether a writer of another party waits for this lock.
    bool isWriterWaiting() const;
    /// Whose access waits.
    LockType lockType() const { return lockType_; }
    bool isLocking() const override { return lockCount() > 0; }
    /// Whether the lock is held or being acquired.
    bool isInUse() const;
    /// Adds a holder. Does nothing at 2^63 - 1 holders. When the system refuses coordinated access, no handler is
    /// called and the lock is idle again.
    void retainLockWithFinishedHandler(KTFileLockHandler handler);
    /// Removes a holder; the last one answers whoever waits.
    void releaseLock();
    void resetLock() override;
    /// How many holders a held lock has; 0 when it is not held.
    std::int64_t lockCount() const override;

    /// As set; without effect.
    bool ignoreSecurityScopedAccess() const;
    void setIgnoreSecurityScopedAccess(bool ignore); // stored only
    /// Whether holding the lock asks for sandboxed access.
    bool requestSecurityScopedURLAccess() const;
    void setRequestSecurityScopedURLAccess(bool request);

    /// The registered lock of a file; null for none.
    static std::shared_ptr<KTFilePresenterLock> lockForURL(const platform::URLRef& url);
    /// `addLockWithType:forURL:`: the registered lock of a file, whatever its type, or a new one; null for a URL
    /// without a path.
    static std::shared_ptr<KTFilePresenterLock> addLockWithType(LockType type, const platform::URLRef& url);
    /// `retainLockForURL:requestSecurityScopedURLAccess:ignoreSecurityScopedURLAccess:withFinishedHandler:` and its
    /// shorter forms: adds a holder to the file's lock, or to a new one of type 0. The options are stored when its
    /// count is 0.
    static void retainLockForURL(const platform::URLRef& url, KTFileLockOptions options = {},
                                 KTFileLockHandler finished = {});
    /// Removes a holder of the file's lock, if there is one.
    static void releaseLockForURL(const platform::URLRef& url);
    /// Unregisters and forgets the file's lock, unless it is in use.
    static void removeLockForURL(const platform::URLRef& url);
    /// The same for all files.
    static void removeUnusedLocks();
    /// A line for each registered lock, for people.
    static std::string _logLocks();

private:
    enum class Party { reader, writer };
    struct Creation {
        explicit Creation() = default;
    };

public:
    /// For the factories; use those.
    KTFilePresenterLock(Creation, LockType type, platform::URLRef url);

private:
    void acquire();
    bool present(platform::Error* error);
    void fail(const std::string& reason);
    void becomeIdle();
    void unregisterUnlessInUse();
    void relinquish(Party party, platform::Reacquirer reacquirer);

    const platform::CoordinatedItem item_;
    const LockType lockType_;
    platform::OperationQueue fpQueue_;
    mutable std::mutex blockCreateLock_; // guards everything below
    HolderCount holders_;
    platform::Reacquirer readerAnswer_, writerAnswer_; // owed to who waits; empty when nobody does
    bool ignoreSecurityScopedAccess_ = false;
    bool requestSecurityScopedURLAccess_ = false;
    bool hasSecurityScope_ = false; // started, and so to be stopped
    bool isRegistered_ = false;
};
