// Coordinated access and locks, compared with the bare system calls for a part of the work. Ratios are of one run; see
// bench/README.md.
#include "CoordinationPlace.h"
#include "Timing.h"

#include <benchmark/benchmark.h>
#include <sqlite3.h>

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <thread>
#include <vector>

using namespace coordinationbench;

namespace {

void openLockClose(const std::string& path, int operation)
{
    const int file = open(path.c_str(), O_RDWR | O_CLOEXEC);
    flock(file, operation);
    close(file);
}

double seconds(int times, const std::function<void()>& work)
{
    const auto start = Clock::now();
    for (int i = 0; i < times; ++i)
        work();
    return std::chrono::duration<double>(Clock::now() - start).count();
}

/// Both alternate in bursts of 100, so that disturbances affect both alike. The median burst of each.
void compare(benchmark::State& state, const std::function<void()>& reference, const std::function<void()>& ours)
{
    constexpr int kBurst = 100;
    std::vector<double> theirs, mine;
    for (auto _ : state) {
        theirs.push_back(seconds(kBurst, reference));
        mine.push_back(seconds(kBurst, ours));
        state.SetIterationTime(mine.back());
    }
    state.counters["reference_us"] = median(theirs) / kBurst * 1e6;
    state.counters["us"] = median(mine) / kBurst * 1e6;
    state.counters["ratio"] = median(mine) / median(theirs);
}

/// At most 1.3 × open, flock, close.
void CoordinatedWrite(benchmark::State& state)
{
    const Place place;
    const CoordinatedItem item(place.url());
    compare(
        state, [&] { openLockClose(place.file(), LOCK_EX); }, [&] { write(item); });
}
BENCHMARK(CoordinatedWrite)->UseManualTime()->MinTime(0.5);

/// At most 2 ×.
void CoordinatedRead(benchmark::State& state)
{
    const Place place;
    const CoordinatedItem item(place.url());
    compare(
        state, [&] { openLockClose(place.file(), LOCK_SH); }, [&] { read(item); });
}
BENCHMARK(CoordinatedRead)->UseManualTime()->MinTime(0.5);

/// At most 1.3 × BEGIN EXCLUSIVE; COMMIT.
void CoordinatedWriteFromPath(benchmark::State& state)
{
    const Place place;
    sqlite3* database = nullptr;
    const auto run = [&](const char* text) { return sqlite3_exec(database, text, nullptr, nullptr, nullptr); };
    if (sqlite3_open(place.other("base.sqlite").c_str(), &database) != SQLITE_OK ||
        run("CREATE TABLE t (x)") != SQLITE_OK)
        std::abort();
    compare(
        state, [&] { run("BEGIN EXCLUSIVE; COMMIT"); }, [&] { write(Place::urlOf(place.file())); });
    sqlite3_close(database);
}
BENCHMARK(CoordinatedWriteFromPath)->UseManualTime()->MinTime(0.5);

/// A thread that waits for work on a condition variable: the minimum cost of a handler on another thread.
class ParkedThread {
public:
    ~ParkedThread()
    {
        handOver([this] { isOver_ = true; });
        thread_.join();
    }
    void handOver(std::function<void()> work)
    {
        {
            const std::lock_guard guard(mutex_);
            work_ = std::move(work);
        }
        changed_.notify_one();
    }

private:
    void serve()
    {
        while (!isOver_) {
            std::unique_lock guard(mutex_);
            changed_.wait(guard, [this] { return work_ != nullptr; });
            const auto work = std::exchange(work_, nullptr);
            guard.unlock();
            work();
        }
    }

    std::mutex mutex_;
    std::condition_variable changed_;
    std::function<void()> work_;
    bool isOver_ = false; // the thread has ended
    std::thread thread_{[this] { serve(); }};
};

/// At most 1.5 × a hand-off to a parked thread and back plus open, flock and close on the first thread.
void PresenterRetainAndRelease(benchmark::State& state)
{
    const Place place;
    ParkedThread parked;
    const auto lock =
        KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, place.url());
    compare(
        state,
        [&] {
            Signal signal;
            parked.handOver([&] { signal.raise(); });
            signal.wait();
            openLockClose(place.file(), LOCK_EX);
        },
        [&] {
            retainAndWait(*lock);
            lock->releaseLock();
        });
}
BENCHMARK(PresenterRetainAndRelease)->UseManualTime()->MinTime(0.5);

/// With 100 idle presenter locks registered: at most 1.2 × the time with none.
void WriteBesideIdleLocks(benchmark::State& state)
{
    const Place place;
    const CoordinatedItem item(place.url()), busy(Place::urlOf(place.other("busy.wav")));
    std::vector<std::shared_ptr<KTFilePresenterLock>> idle;
    double none = 0, beside = 0;
    for (auto _ : state) {
        idle.clear();
        none += seconds(100, [&] { write(item); });
        for (int i = 0; i < 100; ++i)
            idle.push_back(KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters,
                                                                 i < 50 ? item.url() : busy.url()));
        const double taken = seconds(100, [&] { write(item); });
        beside += taken;
        state.SetIterationTime(taken);
    }
    state.counters["ratio"] = beside / none;
}
BENCHMARK(WriteBesideIdleLocks)->UseManualTime()->MinTime(0.5);

} // namespace
