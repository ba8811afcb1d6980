// Coordinated access and locks, beside the bare system calls that do a part of it. Ratios are of one run; see
// bench/README.md.
#include "coordination/KTFileCoordinationLock.h"
#include "coordination/KTFilePresenterLock.h"

#include <benchmark/benchmark.h>
#include <sqlite3.h>

#include <fcntl.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

using namespace platform;

namespace {

using Clock = std::chrono::steady_clock;

/// A file, and a coordination folder of the benchmark's own. Removed at the end.
class Place {
public:
    Place()
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        if (mkdtemp(pattern.data()) == nullptr)
            std::abort();
        folder_ = pattern;
        std::ofstream(file()) << "x";
        FileCoordinator::setCoordinationFolder(folder_ / "coordination");
    }
    ~Place()
    {
        FileCoordinator::setCoordinationFolder({});
        std::filesystem::remove_all(folder_);
    }
    std::string file() const { return folder_ / "song.wav"; }
    std::string other(const std::string& name) const { return folder_ / name; }
    URLRef url() const { return urlOf(file()); }
    static URLRef urlOf(const std::string& path)
    {
        return URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, false);
    }

private:
    std::filesystem::path folder_;
};

void write(const CoordinatedItem& item)
{
    FileCoordinator().coordinateWriting(item, FileCoordinator::WritingOptions::none, [](const URLRef&) {});
}

void read(const CoordinatedItem& item)
{
    FileCoordinator().coordinateReading(item, FileCoordinator::ReadingOptions::none, [](const URLRef&) {});
}

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

/// Both by turns, in bursts of 100, so that what disturbs the machine disturbs both alike: the median burst of each.
void compare(benchmark::State& state, const std::function<void()>& reference, const std::function<void()>& ours)
{
    constexpr int kBurst = 100;
    std::vector<double> theirs, mine;
    for (auto _ : state) {
        theirs.push_back(seconds(kBurst, reference));
        mine.push_back(seconds(kBurst, ours));
        state.SetIterationTime(mine.back());
    }
    const auto median = [](std::vector<double>& values) {
        std::nth_element(values.begin(), values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2), values.end());
        return values[values.size() / 2];
    };
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

/// Retains, and waits for the handler.
template <class Lock>
void retainAndWait(Lock& lock)
{
    std::mutex mutex;
    std::condition_variable changed;
    bool isHeld = false;
    lock.retainLockWithFinishedHandler([&] {
        const std::lock_guard guard(mutex);
        isHeld = true;
        changed.notify_one();
    });
    std::unique_lock guard(mutex);
    changed.wait(guard, [&] { return isHeld; });
}

/// At most 9 ×.
void PresenterRetainAndRelease(benchmark::State& state)
{
    const Place place;
    const auto lock =
        KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, place.url());
    compare(
        state, [&] { openLockClose(place.file(), LOCK_EX); },
        [&] {
            std::mutex mutex;
            std::condition_variable changed;
            bool isHeld = false;
            lock->retainLockWithFinishedHandler([&] {
                const std::lock_guard guard(mutex);
                isHeld = true;
                changed.notify_one();
            });
            std::unique_lock guard(mutex);
            changed.wait(guard, [&] { return isHeld; });
            lock->releaseLock();
        });
}
BENCHMARK(PresenterRetainAndRelease)->UseManualTime()->MinTime(0.5);

/// With 100 idle presenter locks registered: at most 1.2 × with none.
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

// From the release in one process to the accessor in another.

enum class Way { flock, coordinationLock, presenterLock };

/// Shared between processes.
struct Relay {
    std::atomic<int> round = 0;
    std::atomic<std::int64_t> released = 0, entered = 0;
};

std::int64_t now()
{
    return Clock::now().time_since_epoch().count();
}

/// The child: for each round waits for the item and notes when it came in.
[[noreturn]] void comeIn(Way way, const Place& place, Relay& relay)
{
    const CoordinatedItem item(place.url());
    const int file = open(place.file().c_str(), O_RDWR | O_CLOEXEC);
    for (int round = 1;; ++round) {
        while (relay.round < round)
            std::this_thread::yield();
        if (way == Way::flock) {
            flock(file, LOCK_EX);
            relay.entered = now();
            flock(file, LOCK_UN);
        } else {
            FileCoordinator().coordinateWriting(item, FileCoordinator::WritingOptions::none,
                                                [&](const URLRef&) { relay.entered = now(); });
        }
    }
}

/// Returns when the process sleeps, and so waits for the item: for a while, as it may sleep on its way there.
void awaitSleep(pid_t process)
{
    for (int seen = 0; seen < 4;) {
        usleep(100);
        std::ifstream file("/proc/" + std::to_string(process) + "/stat");
        std::string id, name, state;
        file >> id >> name >> state;
        seen = state == "S" ? seen + 1 : 0;
    }
}

/// The microseconds of every hand-off, sorted.
std::vector<double> handOffs(Way way, int rounds)
{
    const Place place;
    void* memory = mmap(nullptr, sizeof(Relay), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    Relay& relay = *new (memory) Relay;
    const pid_t child = fork();
    if (child == 0)
        comeIn(way, place, relay);
    const int file = open(place.file().c_str(), O_RDWR | O_CLOEXEC);
    const auto coordination = KTFileCoordinationLock::initLockForWritingAtURL(place.url());
    const auto presenter =
        KTFilePresenterLock::initLockWithType(KTFilePresenterLock::LockType::readersAndWriters, place.url());
    std::vector<double> taken;
    for (int round = 1; round <= rounds; ++round) {
        relay.entered = 0;
        if (way == Way::flock)
            flock(file, LOCK_EX);
        else if (way == Way::coordinationLock)
            retainAndWait(*coordination);
        else
            retainAndWait(*presenter);
        relay.round = round;
        awaitSleep(child);
        relay.released = now();
        if (way == Way::flock)
            flock(file, LOCK_UN);
        else if (way == Way::coordinationLock)
            coordination->releaseLock();
        else
            presenter->releaseLock();
        while (relay.entered == 0)
            usleep(20);
        taken.push_back(static_cast<double>(relay.entered - relay.released) / 1e3);
    }
    kill(child, SIGKILL);
    waitpid(child, nullptr, 0);
    close(file);
    munmap(memory, sizeof(Relay));
    std::sort(taken.begin(), taken.end());
    return taken;
}

/// Coordination lock: at most 2.5 × the median and 3 × the 99th percentile of flock; presenter lock: 10 × and 4 ×.
void HandOff(benchmark::State& state)
{
    constexpr int kRounds = 1000;
    for (auto _ : state) {
        const std::vector<double> bare = handOffs(Way::flock, kRounds);
        const std::vector<double> ours = handOffs(static_cast<Way>(state.range(0)), kRounds);
        state.counters["flock_us"] = bare[kRounds / 2];
        state.counters["us"] = ours[kRounds / 2];
        state.counters["ratio_median"] = ours[kRounds / 2] / bare[kRounds / 2];
        state.counters["ratio_p99"] = ours[kRounds * 99 / 100] / bare[kRounds * 99 / 100];
    }
}
BENCHMARK(HandOff)->ArgName("way")->Arg(1)->Arg(2)->Iterations(1)->Unit(benchmark::kSecond);

// Eight processes that all want the item.

struct Share {
    std::atomic<std::int64_t> times = 0, longestWait = 0;
};

struct Contention {
    std::int64_t times = 0, smallest = 0, largest = 0, longestWait = 0;
};

Contention contend(bool isBare, std::chrono::seconds length)
{
    constexpr int kProcesses = 8;
    const Place place;
    const std::size_t size = sizeof(Share) * kProcesses;
    auto* shares = static_cast<Share*>(mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    std::vector<pid_t> children;
    const auto end = Clock::now() + length;
    for (int i = 0; i < kProcesses; ++i) {
        const pid_t child = fork();
        if (child == 0) {
            Share& mine = *new (shares + i) Share;
            const CoordinatedItem item(place.url());
            const int file = open(place.file().c_str(), O_RDWR | O_CLOEXEC);
            while (Clock::now() < end) {
                const std::int64_t asked = now();
                const auto held = [&](const URLRef&) {
                    mine.longestWait = std::max(mine.longestWait.load(), now() - asked);
                    ++mine.times;
                    usleep(200);
                };
                if (isBare) {
                    flock(file, LOCK_EX);
                    held(nullptr);
                    flock(file, LOCK_UN);
                } else {
                    FileCoordinator().coordinateWriting(item, FileCoordinator::WritingOptions::none, held);
                }
            }
            _exit(0);
        }
        children.push_back(child);
    }
    for (const pid_t child : children)
        waitpid(child, nullptr, 0);
    Contention result{0, shares[0].times, 0, 0};
    for (int i = 0; i < kProcesses; ++i) {
        result.times += shares[i].times;
        result.smallest = std::min(result.smallest, shares[i].times.load());
        result.largest = std::max(result.largest, shares[i].times.load());
        result.longestWait = std::max(result.longestWait, shares[i].longestWait.load());
    }
    munmap(shares, size);
    return result;
}

/// Throughput at least 0.9 × flock's, smallest to largest share at least 0.95, longest wait at most 0.1 × flock's.
void EightProcesses(benchmark::State& state)
{
    for (auto _ : state) {
        const Contention bare = contend(true, std::chrono::seconds(10));
        const Contention ours = contend(false, std::chrono::seconds(10));
        state.counters["throughput"] = static_cast<double>(ours.times) / static_cast<double>(bare.times);
        state.counters["fairness"] = static_cast<double>(ours.smallest) / static_cast<double>(ours.largest);
        state.counters["fairness_flock"] = static_cast<double>(bare.smallest) / static_cast<double>(bare.largest);
        state.counters["longest_wait"] = static_cast<double>(ours.longestWait) / static_cast<double>(bare.longestWait);
    }
}
BENCHMARK(EightProcesses)->Iterations(1)->Unit(benchmark::kSecond);

} // namespace
