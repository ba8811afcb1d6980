#include "tool/shared/output/Progress.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/core.h>

#include <algorithm>
#include <cstdio>
#include <memory>
#include <optional>
#include <unistd.h>
#include <utility>

Progress::Progress(std::string label, std::int64_t total, bool quiet)
    : label_(std::move(label)),
      total_(std::max<std::int64_t>(total, 1)),
      active_(!quiet && isTerminal(STDERR_FILENO)),
      nextDraw_(Clock::now() + std::chrono::seconds(1))
{
}

Progress::~Progress()
{
    if (shown_)
        std::fputs("\r\x1b[K", stderr);
}

void Progress::advance(std::int64_t bytes)
{
    done_ = std::min(done_ + bytes, total_);
    if (!active_ || Clock::now() < nextDraw_)
        return;
    nextDraw_ = Clock::now() + std::chrono::milliseconds(100);
    shown_ = true;
    draw();
}

void Progress::draw() const
{
    constexpr int kPercentColumns = 8;
    const int bar = std::clamp(terminalColumns() - displayWidth(label_) - kPercentColumns, 0, 40);
    const double part = static_cast<double>(done_) / static_cast<double>(total_);
    const int full = static_cast<int>(part * bar);
    std::fputs(fmt::format("\r{} {:█<{}}{:░<{}} {:3.0f}%", label_, "", full, "", bar - full, part * 100).c_str(),
               stderr);
    std::fflush(stderr);
}

std::function<void(std::int64_t done, std::int64_t all)> copyProgress(std::string label, bool quiet)
{
    struct Copy {
        std::optional<Progress> bar;
        std::int64_t done = 0;
    };
    return [copy = std::make_shared<Copy>(), label = std::move(label), quiet](std::int64_t done, std::int64_t all) {
        if (!copy->bar) {
            copy->bar.emplace(label, all, quiet);
            copy->done = 0;
        }
        copy->bar->advance(done - std::exchange(copy->done, done));
        if (done == all)
            copy->bar.reset();
    };
}
