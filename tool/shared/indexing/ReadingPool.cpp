#include "tool/shared/indexing/ReadingPool.h"

#include "platform/OwnedDescriptor.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/library/IndexedName.h"
#include "tool/shared/threads/StartedThread.h"

#include <algorithm>
#include <array>
#include <ctime>
#include <exception>
#include <fcntl.h>
#include <unistd.h>

namespace {

constexpr std::chrono::milliseconds kMeasuredTime{20};
// Of the processors' time: below it, they wait for storage.
constexpr double kBusyPart = 0.75;

double processorSeconds()
{
    timespec time = {};
    ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
}

// What the system refuses today may be given tomorrow, without any change of the file.
bool isReadable(const std::string& path)
{
    std::array<char, 1> byte;
    const platform::OwnedDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    return file && ::read(file.get(), byte.data(), byte.size()) >= 0;
}

FileReading readJob(ReadingJob job, const LibraryReading& reading)
{
    FileReading result;
    result.job = std::move(job);
    const ListedFile& file = result.job.listed();
    const FilePlace place{result.job.folder->path, nameOfIndexed(file.text)};
    result.record = readLibraryRecord(place, file.stamp, reading);
    if (result.record && result.record->state == "unreadable" && !isReadable(place.path()))
        result.record->stamp.changed = result.record->stamp.inode = 0;
    result.isThere = result.record || stampOfFile(place.path()) == file.stamp;
    return result;
}

} // namespace

ReadingPool::ReadingPool(UpdateInbox& inbox, const LibraryReading& reading, unsigned threads)
    : inbox_(inbox),
      reading_(reading),
      asked_(threads),
      measured_(std::chrono::steady_clock::now()),
      processorSeconds_(processorSeconds())
{
    reading_.goesOn = [this] { return !isEnding_; };
    threads_.reserve(std::max<std::size_t>(threadsFor(threads), kMostWaiting));
}

ReadingPool::~ReadingPool()
{
    stop();
}

void ReadingPool::startThreads(std::size_t count)
{
    for (std::size_t i = 0; i < count; ++i)
        if (std::jthread thread = startedThread([this] { work(); }); thread.joinable())
            threads_.push_back(std::move(thread));
        else
            break;
}

void ReadingPool::give(ReadingJob job)
{
    ++pending_;
    if (threads_.empty())
        startThreads(threadsFor(asked_));
    if (threads_.empty()) {
        inbox_.makeBoundless();
        inbox_.leave(readJob(std::move(job), reading_));
        return;
    }
    {
        const std::lock_guard lock(mutex_);
        jobs_.push_back(std::move(job));
    }
    ready_.notify_one();
}

void ReadingPool::adjust()
{
    const auto now = std::chrono::steady_clock::now();
    const double seconds = std::chrono::duration<double>(now - measured_).count();
    if (now - measured_ < kMeasuredTime || asked_ != 0 || threads_.size() >= kMostWaiting)
        return;
    measured_ = now;
    const double before = std::exchange(processorSeconds_, processorSeconds());
    const double part = (processorSeconds_ - before) / (seconds * threadsFor(0));
    std::size_t waiting = 0;
    {
        const std::lock_guard lock(mutex_);
        waiting = jobs_.size();
    }
    if (part < kBusyPart && waiting > 0)
        startThreads(std::min({threads_.size(), waiting, kMostWaiting - threads_.size()}));
}

void ReadingPool::stop()
{
    const std::lock_guard lock(mutex_);
    isStopped_ = isEnding_ = true;
    jobs_.clear();
    ready_.notify_all();
}

void ReadingPool::work()
{
    try {
        readAll();
    } catch (...) {
        inbox_.fail(std::current_exception());
    }
}

void ReadingPool::readAll()
{
    std::unique_lock lock(mutex_);
    for (;;) {
        ready_.wait(lock, [this] { return isStopped_ || !jobs_.empty(); });
        if (isStopped_)
            return;
        ReadingJob job = std::move(jobs_.front());
        jobs_.pop_front();
        lock.unlock();
        if (!inbox_.leave(readJob(std::move(job), reading_)))
            return;
        lock.lock();
    }
}
