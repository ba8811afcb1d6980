// How both kinds of lock count: idle, being acquired, held, idle again. Not a lock by itself: its owner's mutex guards
// it.
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

class HolderCount {
public:
    using Handler = std::function<void()>;
    enum class Retained { held, pending, mustAcquire, full };

    /// One more holder. `held`: the caller calls the handler, outside the mutex. `pending`: an acquisition is under
    /// way, or calling its handlers, and will call this one behind them. `mustAcquire`: the caller starts the
    /// acquisition, which will call it. `full`: nothing has happened.
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

    /// The lock is had: it counts as held, and its handlers are due, one by one. Then `settle`.
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

    /// The next handler, to be called outside the mutex; none when the last was given. Who retains meanwhile is called
    /// in turn.
    std::optional<Handler> nextHandler()
    {
        isCallingHandlers_ = !dueHandlers_.empty();
        if (!isCallingHandlers_)
            return std::nullopt;
        Handler next = std::move(dueHandlers_.front());
        dueHandlers_.pop_front();
        return next;
    }

    /// Calls what is due, in order; `mutex` is the owner's.
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
    bool cancelCreatingLock_ = false; // the last holder left before the acquisition was done
    bool owesRelease_ = false;        // and it is being finished now
    bool isCallingHandlers_ = false;
    std::vector<Handler> finishedHandlers_; // owned copies, of the first holder and the later ones
    std::deque<Handler> dueHandlers_;       // of the acquisition that is being finished
};
