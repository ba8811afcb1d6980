// Coordinated access that somebody else holds: hand-offs between processes, and many processes that compete for one
// item. Ratios are of one run; see bench/README.md.
#include "CoordinationPlace.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cmath>
#include <thread>
#include <vector>

using namespace coordinationbench;

namespace {

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

/// The child: in each round waits for the item and records when it got it.
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

/// Returns once the process has slept for a while, so that it must be waiting for the item.
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

/// Coordination lock: at most 2.5 × the median and 3 × the 99th percentile of flock; presenter lock: 10 × and 2 ×.
void HandOff(benchmark::State& state)
{
    constexpr int kRounds = 1000;
    for (auto _ : state) {
        const std::vector<double> bare = handOffs(Way::flock, kRounds);
        const std::vector<double> ours = handOffs(static_cast<Way>(state.range(0)), kRounds);
        state.counters["flock_us"] = bare[kRounds / 2];
        state.counters["us"] = ours[kRounds / 2];
        state.counters["flock_p99_us"] = bare[kRounds * 99 / 100];
        state.counters["p99_us"] = ours[kRounds * 99 / 100];
        state.counters["ratio_median"] = ours[kRounds / 2] / bare[kRounds / 2];
        state.counters["ratio_p99"] = ours[kRounds * 99 / 100] / bare[kRounds * 99 / 100];
    }
}
BENCHMARK(HandOff)->ArgName("way")->Arg(1)->Arg(2)->Iterations(1)->Unit(benchmark::kSecond);

// Eight processes compete for the item.

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
        state.counters["longest_us"] = static_cast<double>(ours.longestWait) / 1e3;
        state.counters["flock_longest_us"] = static_cast<double>(bare.longestWait) / 1e3;
        state.counters["longest_wait"] = static_cast<double>(ours.longestWait) / static_cast<double>(bare.longestWait);
    }
}
BENCHMARK(EightProcesses)->Iterations(1)->Unit(benchmark::kSecond);

// Whoever leaves comes back at once, behind all waiters.

struct Crowd {
    std::atomic<int> ready = 0;
    std::atomic<bool> isOver = false;
    std::atomic<std::int64_t> times = 0;
};

/// Microseconds from one access to the next with that many processes waiting.
double timePerHandOff(int waiting)
{
    constexpr std::chrono::milliseconds kSettling(300), kLength(1000);
    const Place place;
    void* memory = mmap(nullptr, sizeof(Crowd), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    Crowd& crowd = *new (memory) Crowd;
    std::vector<pid_t> children;
    for (int i = 0; i <= waiting; ++i) {
        const pid_t child = fork();
        if (child == 0) {
            const CoordinatedItem item(place.url());
            for (++crowd.ready; !crowd.isOver;)
                FileCoordinator().coordinateWriting(item, FileCoordinator::WritingOptions::none,
                                                    [&](const URLRef&) { ++crowd.times; });
            _exit(0);
        }
        children.push_back(child);
    }
    while (crowd.ready <= waiting)
        usleep(1000);
    std::this_thread::sleep_for(kSettling); // all of them have asked
    const std::int64_t first = crowd.times, start = now();
    std::this_thread::sleep_for(kLength);
    const double taken = static_cast<double>(now() - start) / static_cast<double>(crowd.times - first) / 1e3;
    crowd.isOver = true;
    for (const pid_t child : children)
        waitpid(child, nullptr, 0);
    munmap(memory, sizeof(Crowd));
    return taken;
}

/// Growth of the time with the number of waiters: the exponent of the best-fitting power.
void Waiters(benchmark::State& state)
{
    constexpr std::array<int, 4> kNumbers = {1, 10, 100, 1000};
    for (auto _ : state) {
        double x = 0, y = 0, xx = 0, xy = 0;
        for (const int waiting : kNumbers) {
            const double taken = timePerHandOff(waiting);
            state.counters["us_" + std::to_string(waiting)] = taken;
            const double a = std::log(waiting), b = std::log(taken);
            x += a, y += b, xx += a * a, xy += a * b;
        }
        const double n = kNumbers.size();
        state.counters["exponent"] = (n * xy - x * y) / (n * xx - x * x);
    }
}
BENCHMARK(Waiters)->Iterations(1)->Unit(benchmark::kSecond);

} // namespace
