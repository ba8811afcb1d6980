#include "platform/OperationQueue.h"

#include "platform/posix/Descriptor.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <system_error>
#include <thread>

#include <pthread.h>
#include <signal.h>

namespace platform {

namespace {

/// The threads that wait for work. A forked child begins with an empty set: its threads did not come along.
class BackgroundThreads {
public:
    static BackgroundThreads& shared();

    bool run(std::function<void()> work)
    {
        std::unique_lock lock(mutex_);
        if (idle_ > work_.size()) {
            work_.push_back(std::move(work));
            wake_.notify_one();
            return true;
        }
        lock.unlock();
        return startThread(std::move(work));
    }

private:
    static constexpr std::chrono::seconds kIdleTime{1};

    bool startThread(std::function<void()> work)
    {
        // The host's signal handlers are the business of the host's threads.
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

    void serve(std::function<void()> work)
    {
        for (;;) {
            work();
            work = nullptr; // what it captured goes before the wait
            std::unique_lock lock(mutex_);
            ++idle_;
            wake_.wait_for(lock, kIdleTime, [this] { return !work_.empty(); });
            --idle_;
            if (work_.empty())
                return;
            work = std::move(work_.front());
            work_.pop_front();
        }
    }

    std::mutex mutex_;
    std::condition_variable wake_;
    std::deque<std::function<void()>> work_; // never more than there are idle threads
    std::size_t idle_ = 0;
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
