// The threads of the server of a page.
#pragma once

#include <httplib.h>

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <pthread.h>
#include <vector>

/// As many as can be started, with stacks of a known size. Those of the server library have what `ulimit -s` says, and
/// end the process if one of them cannot be started.
class ServingThreads final : public httplib::TaskQueue {
public:
    /// Throws std::system_error if there is none.
    explicit ServingThreads(std::size_t most);
    ~ServingThreads() override { shutdown(); }
    ServingThreads(const ServingThreads&) = delete;
    ServingThreads& operator=(const ServingThreads&) = delete;

    void enqueue(std::function<void()> job) override;
    /// Waits for the jobs that were given.
    void shutdown() override;

private:
    static void* run(void* self);
    void work();

    std::mutex mutex_;
    std::condition_variable ready_;
    std::deque<std::function<void()>> jobs_;
    bool isStopped_ = false;
    std::vector<pthread_t> threads_;
};
