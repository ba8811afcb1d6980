// Work done by several threads whose results come out in the order in which it was put in. Neither waiting work nor
// waiting results pile up: whoever is ahead waits.
#pragma once

#include "tool/shared/threads/StartedThread.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <optional>
#include <span>
#include <vector>

/// One thread gives jobs, one takes results. `work` runs on all threads at once and must not throw. Of the threads as
/// many work as can be started; without any, the one that takes results works. The destructor stops the threads after
/// the job that each is at.
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

    /// Waits for room, of half the window once it is full; false when no more is wanted.
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
    /// No job will follow.
    void close()
    {
        const std::lock_guard lock(mutex_);
        closed_ = true;
        ready_.notify_all();
        done_.notify_all();
    }
    /// Waits for the next result; none when all were taken.
    std::optional<Result> take()
    {
        std::unique_lock lock(mutex_);
        done_.wait(lock, [this] {
            return entries_.empty() ? closed_ : threads_.empty() || entries_.front().result.has_value();
        });
        if (entries_.empty())
            return std::nullopt;
        if (threads_.empty()) {
            ++started_;
            Entry& entry = entries_.front(); // stays where it is while others come behind it
            lock.unlock();
            Result result = work_(entry.job);
            lock.lock();
            entry.result = std::move(result);
        }
        std::optional<Result> result = std::move(*entries_.front().result);
        entries_.pop_front();
        --started_;
        if (entries_.size() == window_ / 2) // half of it at once: a wait for each job costs more than small jobs do
            room_.notify_one();
        return result;
    }
    /// Ends all waiting of those that give jobs and of the workers.
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
        std::unique_lock lock(mutex_);
        for (;;) {
            ready_.wait(lock, [this] { return stopped_ || closed_ || started_ < entries_.size(); });
            if (stopped_ || started_ == entries_.size())
                return;
            // Of many jobs several, for which one waits once; of few one, so that all threads have some.
            const std::size_t share = (entries_.size() - started_) / (2 * threadCount_);
            std::array<Entry*, kMostAtOnce> taken; // they stay where they are while others come and go at the ends
            const std::size_t count = std::clamp<std::size_t>(share, 1, kMostAtOnce);
            for (std::size_t i = 0; i < count; ++i)
                taken[i] = &entries_[started_++];
            workOn(std::span(taken).first(count), lock);
        }
    }
    /// Results of quick jobs are handed over together, and none is kept for long.
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
    std::deque<Entry> entries_; // in order; the first `started_` are done or being worked on
    std::size_t started_ = 0;
    std::size_t threadCount_;
    std::size_t window_;
    bool closed_ = false;
    bool stopped_ = false;
    std::function<Result(const Job&)> work_;
    std::vector<std::jthread> threads_; // last: they end before what they use
};
