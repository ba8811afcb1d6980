// The states that both kinds of lock count through: idle, being acquired, held, idle again. Not a lock by itself: its
// owner's mutex guards it.
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <iterator>
#include <limits>
#include <mutex>
#include <optional>
#include <utility>
#include <vector>

/// Holders of one lock, and the handlers that wait for it.
class HolderCount {
public:
    /// Called when a holder has the lock; may be empty.
    using Handler = std::function<void()>;
    /// What retain() leaves to its caller.
    enum class Retained { held, pending, mustAcquire, full };

    /// Adds a holder. `held`: the caller calls the handler, outside the mutex. `pending`: an acquisition is under way
    /// or calls its handlers, and calls this one after them. `mustAcquire`: the caller starts the acquisition, which
    /// calls it. `full`: nothing has changed.
    Retained retain(const Handler& handler)
    {
        if (lockCount_ == std::numeric_limits<std::int64_t>::max())
            return Retained::full;
        if (lockCount_ > 0) {
            ++lockCount_;
            if (!isCallingHandlers_)
                return Retained::held;
            dueHandlers_.push_back(handler);
            return Retained::pending;
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

    /// Removes a holder; true when it was the last of a held lock.
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

    /// Removes all holders of a held lock; true when there were any.
    bool reset()
    {
        if (lockCount_ > 0)
            lockCount_ = 1;
        return lockCount_ > 0 && release();
    }

    /// Ends an acquisition: the lock counts as held, and its handlers are due, one by one. Call settle() afterwards.
    void acquired()
    {
        lockCount_ += 1 + std::exchange(additionalLockCount_, 0);
        creatingLock_ = false;
        owesRelease_ = std::exchange(cancelCreatingLock_, false);
        dueHandlers_.assign(std::make_move_iterator(finishedHandlers_.begin()),
                            std::make_move_iterator(finishedHandlers_.end()));
        finishedHandlers_.clear();
        isCallingHandlers_ = true;
    }

    /// The next handler, to be called outside the mutex; null after the last. A holder that is added meanwhile is
    /// called in turn.
    std::optional<Handler> nextHandler()
    {
        isCallingHandlers_ = !dueHandlers_.empty();
        if (!isCallingHandlers_)
            return std::nullopt;
        Handler next = std::move(dueHandlers_.front());
        dueHandlers_.pop_front();
        return next;
    }

    /// Calls the due handlers in order; `mutex` is the owner's.
    void callHandlers(std::mutex& mutex)
    {
        for (;;) {
            std::unique_lock guard(mutex);
            const std::optional<Handler> handler = nextHandler();
            guard.unlock();
            if (!handler)
                return;
            if (*handler)
                (*handler)();
        }
    }

    /// Called after the handlers of an acquisition whose last holder left before it was done; true when the lock is
    /// now held without holders. Handlers that retained keep it.
    bool settle() { return std::exchange(owesRelease_, false) && !creatingLock_ && release(); }

    /// Ends an acquisition that failed: nobody is called, and the next holder starts anew. The handlers are returned
    /// only to be destroyed outside the mutex.
    std::vector<Handler> failed()
    {
        additionalLockCount_ = 0;
        creatingLock_ = cancelCreatingLock_ = false;
        return std::exchange(finishedHandlers_, {});
    }

    /// How many holders the held lock has; 0 when it is not held.
    std::int64_t count() const { return lockCount_; }
    /// Whether the lock is held or being acquired.
    bool isInUse() const { return lockCount_ > 0 || creatingLock_; }

private:
    std::int64_t lockCount_ = 0;
    std::int64_t additionalLockCount_ = 0; // holders that came while the acquisition was in progress
    bool creatingLock_ = false;
    bool cancelCreatingLock_ = false; // the last holder left before the acquisition was done
    bool owesRelease_ = false;        // and it is being finished now
    bool isCallingHandlers_ = false;
    std::vector<Handler> finishedHandlers_; // owned copies, of the first holder and the later ones
    std::deque<Handler> dueHandlers_;       // of the acquisition that is being finished
};
