#include "platform/OperationQueue.h"

#include "platform/posix/Descriptor.h"

#include <cerrno>
#include <chrono>
#include <deque>
#include <mutex>
#include <new>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include <pthread.h>
#include <semaphore.h>
#include <signal.h>
#include <time.h>

namespace platform {

namespace {

/// Idle threads. A forked child begins with none, since threads do not survive a fork. Work goes to the thread that
/// parked last, whose data is still in the processor's caches.
class BackgroundThreads {
public:
    static BackgroundThreads& shared();

    bool run(std::function<void()> work)
    {
        std::unique_lock lock(mutex_);
        if (parked_.empty()) {
            lock.unlock();
            return startThread(std::move(work));
        }
        const std::shared_ptr<Parked> last = std::move(parked_.back());
        parked_.pop_back();
        lock.unlock();
        last->give(std::move(work));
        return true;
    }

private:
    static constexpr std::chrono::seconds kIdleTime{1};

    /// Where a thread waits for work. Shared with whoever gives the work, because the thread may end before giving is
    /// done. A semaphore, because waking from a condition variable takes a mutex and costs another system call when
    /// that is released.
    class Parked {
    public:
        Parked() { ::sem_init(&given_, 0, 0); }
        ~Parked() { ::sem_destroy(&given_); }
        Parked(const Parked&) = delete;
        Parked& operator=(const Parked&) = delete;

        void give(std::function<void()> work)
        {
            work_ = std::move(work);
            ::sem_post(&given_);
        }
        /// False if no work came in that time, which a change of the system clock shortens or lengthens.
        bool waitFor(std::chrono::seconds length)
        {
            timespec end = {};
            ::clock_gettime(CLOCK_REALTIME, &end);
            end.tv_sec += length.count();
            int result = 0;
            do
                result = ::sem_timedwait(&given_, &end);
            while (result != 0 && errno == EINTR);
            return result == 0;
        }
        void wait()
        {
            while (::sem_wait(&given_) != 0) {
            }
        }
        std::function<void()> take() { return std::exchange(work_, nullptr); }

    private:
        sem_t given_;
        std::function<void()> work_;
    };

    bool startThread(std::function<void()> work)
    {
        // Signals of the host are handled by the host's threads.
        sigset_t all, before;
        sigfillset(&all);
        pthread_sigmask(SIG_SETMASK, &all, &before);
        bool started = true;
        try {
            std::thread([this, first = std::move(work)]() mutable { serve(std::move(first)); }).detach();
        } catch (const std::system_error&) {
            started = false;
        }
        pthread_sigmask(SIG_SETMASK, &before, nullptr);
        return started;
    }

    /// False if there is no memory, which ends the thread.
    bool park(std::shared_ptr<Parked>& mine)
    {
        try {
            if (!mine)
                mine = std::make_shared<Parked>();
            const std::lock_guard lock(mutex_);
            parked_.push_back(mine);
            return true;
        } catch (const std::bad_alloc&) {
            return false;
        }
    }

    void serve(std::function<void()> work)
    {
        std::shared_ptr<Parked> mine;
        for (;;) {
            work();
            work = nullptr; // destroys its captures before the wait
            if (!park(mine))
                return;
            if (!mine->waitFor(kIdleTime)) {
                std::unique_lock lock(mutex_);
                if (std::erase(parked_, mine) > 0)
                    return;
                lock.unlock();
                mine->wait(); // work was given in that moment
            }
            work = mine->take();
        }
    }

    std::mutex mutex_;
    std::vector<std::shared_ptr<Parked>> parked_; // without work
};

BackgroundThreads& BackgroundThreads::shared()
{
    static PerProcess<BackgroundThreads> threads;
    return threads.get();
}

} // namespace

bool runInBackground(std::function<void()> work)
{
    return BackgroundThreads::shared().run(std::move(work));
}

struct OperationQueue::State {
    std::mutex mutex;
    std::deque<std::function<void()>> waiting;
    const int maximum;
    int running = 0;

    explicit State(int maximumConcurrent) : maximum(maximumConcurrent) {}

    void drain()
    {
        std::unique_lock lock(mutex);
        while (!waiting.empty()) {
            std::function<void()> operation = std::move(waiting.front());
            waiting.pop_front();
            lock.unlock();
            operation();
            operation = nullptr;
            lock.lock();
        }
        --running;
    }
};

OperationQueue::OperationQueue(int maxConcurrentOperations) : state_(std::make_shared<State>(maxConcurrentOperations))
{
}

bool OperationQueue::add(std::function<void()> operation)
{
    State& state = *state_;
    std::unique_lock lock(state.mutex);
    state.waiting.push_back(std::move(operation));
    if (state.running == state.maximum)
        return true;
    ++state.running;
    if (runInBackground([kept = state_] { kept->drain(); }))
        return true;
    if (--state.running > 0)
        return true;
    state.waiting.pop_back();
    return false;
}

} // namespace platform
