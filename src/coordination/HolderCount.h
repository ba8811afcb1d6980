// How both kinds of lock count: idle, being acquired, held, idle again. Not a lock by itself: its owner's mutex guards
// it.
#pragma once

#include <cstdint>
#include <functional>
#include <limits>
#include <utility>
#include <vector>

class HolderCount {
public:
    using Handler = std::function<void()>;
    enum class Retained { held, pending, mustAcquire, full };

    /// One more holder. `held`: the caller calls the handler, outside the mutex. `pending`: an acquisition is under way
    /// and will call it. `mustAcquire`: the caller starts the acquisition, which will call it. `full`: nothing has
    /// happened.
    Retained retain(const Handler& handler)
    {
        if (lockCount_ == std::numeric_limits<std::int64_t>::max())
            return Retained::full;
        if (lockCount_ > 0) {
            ++lockCount_;
            return Retained::held;
        }
        finishedHandlers_.push_back(handler);
        if (!creatingLock_) {
            creatingLock_ = true;
            return Retained::mustAcquire;
        }
        // After a cancellation the acquisition that is under way is this holder's own.
        if (!std::exchange(cancelCreatingLock_, false))
            ++additionalLockCount_;
        return Retained::pending;
    }

    /// One holder less; true when that was the last of a held lock.
    bool release()
    {
        if (creatingLock_) {
            if (additionalLockCount_ >= 1)
                --additionalLockCount_;
            else
                cancelCreatingLock_ = true;
            return false;
        }
        return lockCount_ > 0 && --lockCount_ == 0;
    }

    /// All holders of a held lock less; true when there were any.
    bool reset()
    {
        if (lockCount_ > 0)
            lockCount_ = 1;
        return lockCount_ > 0 && release();
    }

    /// The lock is had: it counts as held, and these handlers are to be called in this order. Then `settle`.
    std::vector<Handler> acquired()
    {
        lockCount_ += 1 + std::exchange(additionalLockCount_, 0);
        creatingLock_ = false;
        owesRelease_ = std::exchange(cancelCreatingLock_, false);
        return std::exchange(finishedHandlers_, {});
    }

    /// Ends an acquisition whose last holder had left before it was done, now that its handlers were called; true when
    /// that leaves a lock that was held without holders. Handlers that retained keep it.
    bool settle() { return std::exchange(owesRelease_, false) && !creatingLock_ && release(); }

    /// The acquisition has failed: nobody is called, and the next holder starts anew. The handlers are given back only
    /// to be dropped outside the mutex.
    std::vector<Handler> failed()
    {
        additionalLockCount_ = 0;
        creatingLock_ = cancelCreatingLock_ = false;
        return std::exchange(finishedHandlers_, {});
    }

    std::int64_t count() const { return lockCount_; }
    bool isInUse() const { return lockCount_ > 0 || creatingLock_; }

private:
    std::int64_t lockCount_ = 0;
    std::int64_t additionalLockCount_ = 0; // holders that came while the acquisition was in progress
    bool creatingLock_ = false;
    bool cancelCreatingLock_ = false;       // the last holder left before the acquisition was done
    bool owesRelease_ = false;              // and it is being finished now
    std::vector<Handler> finishedHandlers_; // owned copies, of the first holder and the later ones
};
