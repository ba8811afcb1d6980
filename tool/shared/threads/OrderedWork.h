// Work done by several threads with results in the order of the jobs. Neither jobs nor results pile up: whoever is
// ahead waits.
#pragma once

#include "tool/shared/threads/StartedThread.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <exception>
#include <functional>
#include <mutex>
#include <optional>
#include <span>
#include <vector>

/// One thread gives jobs, one takes results. `work` runs on all threads at once. As many threads are used as can be
/// started; without any, the thread that takes results does the work. The destructor stops the threads after their
/// current jobs.
template <class Job, class Result>
class OrderedWork {
public:
    OrderedWork(unsigned threads, std::size_t window, std::function<Result(const Job&)> work)
        : threadCount_(threads),
          window_(window),
          work_(std::move(work))
    {
        threads_.reserve(threads);
        for (unsigned i = 0; i < threads; ++i)
            if (std::jthread thread = startedThread([this] { workUntilDone(); }); thread.joinable())
                threads_.push_back(std::move(thread));
            else
                break;
    }
    ~OrderedWork() { stop(); }

    /// Waits for room, once the window is full until half of it is free; false if no more is wanted.
    bool give(Job job)
    {
        std::unique_lock lock(mutex_);
        room_.wait(lock, [this] { return stopped_ || entries_.size() < window_; });
        if (stopped_)
            return false;
        entries_.push_back({std::move(job), {}});
        (threads_.empty() ? done_ : ready_).notify_one();
        return true;
    }
    /// Announces that no job will follow.
    void close()
    {
        const std::lock_guard lock(mutex_);
        closed_ = true;
        ready_.notify_all();
        done_.notify_all();
    }
    /// Stops all, where an exception would leave a thread: `take` throws it.
    void fail(std::exception_ptr problem)
    {
        const std::lock_guard lock(mutex_);
        problem_ = std::move(problem);
        stopped_ = true;
        ready_.notify_all();
        room_.notify_all();
        done_.notify_all();
    }
    /// Waits for the next result; none if all were taken. Throws what `work` threw, or the giver failed with.
    std::optional<Result> take()
    {
        std::unique_lock lock(mutex_);
        done_.wait(lock, [this] {
            return problem_ || (entries_.empty() ? closed_ : threads_.empty() || entries_.front().result.has_value());
        });
        if (problem_)
            std::rethrow_exception(problem_);
        if (entries_.empty())
            return std::nullopt;
        if (threads_.empty()) {
            ++started_;
            Entry& entry = entries_.front(); // its address is stable while others are added
            lock.unlock();
            Result result = work_(entry.job);
            lock.lock();
            entry.result = std::move(result);
        }
        std::optional<Result> result = std::move(*entries_.front().result);
        entries_.pop_front();
        --started_;
        // Wakes the giver for half the window at once, because a wait for each small job costs more than the job.
        if (entries_.size() == window_ / 2)
            room_.notify_one();
        return result;
    }
    /// Wakes everybody who gives jobs or works on them, for good.
    void stop()
    {
        const std::lock_guard lock(mutex_);
        stopped_ = true;
        ready_.notify_all();
        room_.notify_all();
    }

private:
    struct Entry {
        Job job;
        std::optional<Result> result;
    };

    void workUntilDone()
    {
        try {
            workOnAll();
        } catch (...) {
            fail(std::current_exception());
        }
    }
    void workOnAll()
    {
        std::unique_lock lock(mutex_);
        for (;;) {
            ready_.wait(lock, [this] { return stopped_ || closed_ || started_ < entries_.size(); });
            if (stopped_ || started_ == entries_.size())
                return;
            // Takes several of many jobs at once to wait less often, and one of few, so that all threads have some.
            const std::size_t share = (entries_.size() - started_) / (2 * threadCount_);
            std::array<Entry*, kMostAtOnce> taken; // addresses are stable while others come and go at the ends
            const std::size_t count = std::clamp<std::size_t>(share, 1, kMostAtOnce);
            for (std::size_t i = 0; i < count; ++i)
                taken[i] = &entries_[started_++];
            workOn(std::span(taken).first(count), lock);
        }
    }
    /// Passes on results of quick jobs together, and keeps none for long.
    void workOn(std::span<Entry* const> taken, std::unique_lock<std::mutex>& lock)
    {
        std::array<std::optional<Result>, kMostAtOnce> results;
        for (std::size_t first = 0, next = 0; next < taken.size() && !stopped_; first = next) {
            lock.unlock();
            const auto start = std::chrono::steady_clock::now();
            do {
                results[next].emplace(work_(taken[next]->job));
                ++next;
            } while (next < taken.size() && std::chrono::steady_clock::now() - start < kLongestKept);
            lock.lock();
            for (std::size_t i = first; i < next; ++i)
                taken[i]->result = std::move(results[i]);
            if (taken[first] == &entries_.front())
                done_.notify_one();
        }
    }

    static constexpr std::size_t kMostAtOnce = 8;
    static constexpr std::chrono::microseconds kLongestKept{200};

    std::mutex mutex_;
    std::condition_variable room_, ready_, done_;
    std::deque<Entry> entries_; // in order; the first `started_` are done or in progress
    std::size_t started_ = 0;
    std::size_t threadCount_;
    std::size_t window_;
    bool closed_ = false;
    bool stopped_ = false;
    std::exception_ptr problem_;
    std::function<Result(const Job&)> work_;
    std::vector<std::jthread> threads_; // last: they end before what they use
};
