#include "tool/shared/access/Waiting.h"

#include "platform/OperationQueue.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/format.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <future>
#include <memory>

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::seconds kUntold{1};

Clock::time_point endOf(const WaitOptions& options, Clock::time_point start)
{
    if (!options.timeoutSeconds)
        return Clock::time_point::max();
    const std::chrono::duration<double> limit(std::max(*options.timeoutSeconds, kShortestWait));
    return limit < Clock::time_point::max() - start ? start + std::chrono::duration_cast<Clock::duration>(limit)
                                                    : Clock::time_point::max();
}

} // namespace

void awaitOthers(const std::string& path, const WaitOptions& options, const std::function<std::string()>& blockers,
                 std::function<void()> wait)
{
    const auto start = Clock::now();
    const auto end = endOf(options, start);
    const auto task = std::make_shared<std::packaged_task<void()>>(std::move(wait));
    std::future<void> done = task->get_future();
    if (!platform::runInBackground([task] { (*task)(); })) {
        if (options.timeoutSeconds)
            throw Failure("no thread can be had to wait for others with a time limit");
        (*task)(); // an exception is dropped
    }
    const auto isDoneBy = [&](Clock::time_point time) { return done.wait_until(time) == std::future_status::ready; };
    if (!options.quiet && start + kUntold < end && !isDoneBy(start + kUntold))
        printWaiting(path, blockers());
    if (options.timeoutSeconds && !isDoneBy(end))
        throw Failure(stillInUseText(blockers(), *options.timeoutSeconds));
    done.get();
}

void printWaiting(const std::string& path, const std::string& blockers)
{
    reportFailure(path, "waiting for " + blockers + " ...");
}

std::string stillInUseText(const std::string& blockers, double seconds)
{
    return fmt::format("still in use by {} after {:g} seconds", blockers, seconds);
}
