// The threads that read files for an index: as few as keep the processors busy, and more while they wait for storage.
#pragma once

#include "tool/shared/indexing/LibraryFileReader.h"
#include "tool/shared/indexing/UpdateInbox.h"

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <thread>
#include <vector>

/// Leaves each file that was read in the inbox, in no order. The destructor waits for the files in progress.
class ReadingPool {
public:
    /// `threads` are used from the first file on; with 0 one for each processor, and more as they are found waiting.
    /// Without any, the giver reads.
    ReadingPool(UpdateInbox& inbox, const LibraryReading& reading, unsigned threads);
    ~ReadingPool();

    void give(ReadingJob job);
    /// Files that were given, and whose reading was not counted back by `took`.
    std::size_t pending() const { return pending_; }
    void took(std::size_t readings) { pending_ -= readings; }
    /// Call now and then: starts further threads when those there are wait most of the time.
    void adjust();
    /// Forgets the files that nobody has begun, and ends the reading of the others early.
    void stop();

private:
    void startThreads(std::size_t count);
    void work();
    void readAll();

    static constexpr std::size_t kMostWaiting = 32; // threads, unless the user asks for more

    UpdateInbox& inbox_;
    std::atomic<bool> isEnding_ = false;
    LibraryReading reading_;
    unsigned asked_;
    std::size_t pending_ = 0; // of the giver's
    std::chrono::steady_clock::time_point measured_;
    double processorSeconds_ = 0; // when measured

    std::mutex mutex_;
    std::condition_variable ready_;
    std::deque<ReadingJob> jobs_;
    bool isStopped_ = false;
    std::vector<std::jthread> threads_; // last: they end before what they use
};
