#include "tool/page/server/ServingThreads.h"

#include <exception>
#include <system_error>
#include <utility>

namespace {

// The server library reads a header of ranges by recursion; 8 KB of it, the most that it takes, need more than 2 MB.
constexpr std::size_t kStackSize = std::size_t{8} << 20;

} // namespace

ServingThreads::ServingThreads(std::size_t most)
{
    threads_.reserve(most);
    pthread_attr_t attributes;
    int error = ::pthread_attr_init(&attributes);
    if (error == 0)
        error = ::pthread_attr_setstacksize(&attributes, kStackSize);
    pthread_t thread = {};
    while (threads_.size() < most && error == 0)
        if (error = ::pthread_create(&thread, &attributes, run, this); error == 0)
            threads_.push_back(thread);
    ::pthread_attr_destroy(&attributes);
    if (threads_.empty())
        throw std::system_error(error, std::generic_category(), "no thread can be started");
}

void ServingThreads::enqueue(std::function<void()> job)
{
    {
        const std::lock_guard lock(mutex_);
        jobs_.push_back(std::move(job));
    }
    ready_.notify_one();
}

void ServingThreads::shutdown()
{
    {
        const std::lock_guard lock(mutex_);
        isStopped_ = true;
    }
    ready_.notify_all();
    for (const pthread_t thread : std::exchange(threads_, {}))
        ::pthread_join(thread, nullptr);
}

void* ServingThreads::run(void* self)
{
    static_cast<ServingThreads*>(self)->work();
    return nullptr;
}

void ServingThreads::work()
{
    std::unique_lock lock(mutex_);
    for (;;) {
        ready_.wait(lock, [this] { return isStopped_ || !jobs_.empty(); });
        if (jobs_.empty())
            return;
        const std::function<void()> job = std::move(jobs_.front());
        jobs_.pop_front();
        lock.unlock();
        try {
            job();
        } catch (const std::exception&) { // for want of memory: the others go on
        }
        lock.lock();
    }
}
