#include "tool/shared/output/ProgressLine.h"

#include "tool/shared/output/Terminal.h"

#include <atomic>
#include <chrono>
#include <string_view>
#include <unistd.h>

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kBetweenDraws{100};
constexpr std::chrono::milliseconds kBehindOutput{300}; // streaming output is progress enough

std::recursive_mutex mutex; // recursive: the thread that writes output may report progress meanwhile
std::atomic<bool> isShown = false;
std::atomic<Clock::time_point> nextDraw = Clock::time_point();
static_assert(std::atomic<bool>::is_always_lock_free);

// Bypasses the stream's buffer, which a signal handler must not touch. A terminal that is not ready gets no progress.
void put(std::string_view text)
{
    [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, text.data(), text.size());
}

constexpr std::string_view kClear = "\r\x1b[K";

} // namespace

void progressline::draw(const std::function<std::string(int columns)>& text)
{
    if (Clock::now() < nextDraw.load())
        return;
    const std::unique_lock lock(mutex, std::try_to_lock);
    if (!lock)
        return;
    nextDraw = Clock::now() + kBetweenDraws;
    const int columns = terminalColumns() - 1; // a full line would wrap
    isShown = true;
    put("\r" + text(columns) + "\x1b[K");
}

progressline::Cleared::Cleared() : lock_(mutex)
{
    if (!isShown.exchange(false))
        return;
    put(kClear);
    nextDraw = Clock::now() + kBehindOutput;
}

void progressline::clearFromSignalHandler()
{
    if (isShown)
        put(kClear);
}
