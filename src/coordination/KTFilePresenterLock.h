// A lock that presents its file, and while it is held lets other parties' coordinated access wait.
#pragma once

#include "coordination/HolderCount.h"
#include "coordination/KTFileLock.h"

#include <mutex>
#include <string>

/// Acquired by a coordinated write, so that whoever has access then is done; after that it makes others wait by not
/// answering them. Owned by shared pointers only: the class's table, callers, and whatever is under way have a share.
/// Any thread may use it.
class KT_EXPORT KTFilePresenterLock final : public KTFileLock,
                                            public platform::FilePresenter,
                                            public std::enable_shared_from_this<KTFilePresenterLock> {
public:
    /// Whose coordinated access must wait while the lock is held.
    enum class LockType : std::uint64_t { readersAndWriters = 0, readersOnly = 1, writersOnly = 2 };

    /// `initLockWithType:forURL:` Registers itself as a presenter at once, though others ask it only while it is held
    /// or being acquired. A lock whose URL cannot be presented (none, or without a path) can never be acquired.
    static std::shared_ptr<KTFilePresenterLock> initLockWithType(LockType type, platform::URLRef url);
    ~KTFilePresenterLock() override;

    const platform::URLRef& url() const { return item_.url(); }
    platform::URLRef presentedItemURL() const override { return url(); }
    platform::OperationQueue& presentedItemOperationQueue() override { return fpQueue_; }
    void relinquishPresentedItemToReader(platform::Reacquirer reacquirer) override;
    void relinquishPresentedItemToWriter(platform::Reacquirer reacquirer) override;

    /// Whether another party waits for this lock.
    bool isReaderWaiting() const;
    bool isWriterWaiting() const;
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

    bool ignoreSecurityScopedAccess() const;
    void setIgnoreSecurityScopedAccess(bool ignore); // stored only
    bool requestSecurityScopedURLAccess() const;
    void setRequestSecurityScopedURLAccess(bool request);

    static std::shared_ptr<KTFilePresenterLock> lockForURL(const platform::URLRef& url);
    /// `addLockWithType:forURL:` The file's registered lock, whatever its type, or a new one; null for a URL without a
    /// path.
    static std::shared_ptr<KTFilePresenterLock> addLockWithType(LockType type, const platform::URLRef& url);
    /// `retainLockForURL:requestSecurityScopedURLAccess:ignoreSecurityScopedURLAccess:withFinishedHandler:` and its
    /// shorter forms. Finds or adds the file's lock, of type 0; the options are stored when its count is 0.
    static void retainLockForURL(const platform::URLRef& url, KTFileLockOptions options = {},
                                 KTFileLockHandler finished = {});
    static void releaseLockForURL(const platform::URLRef& url);
    /// Unregisters and forgets the file's lock, unless it is in use.
    static void removeLockForURL(const platform::URLRef& url);
    static void removeUnusedLocks();
    /// A line for each registered lock, for people.
    static std::string _logLocks();

private:
    enum class Party { reader, writer };
    struct Creation {
        explicit Creation() = default;
    };

public:
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
