#include "tool/shared/output/FilesProgress.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <cstdio>
#include <unistd.h>
#include <utility>

FilesProgress::FilesProgress(std::string label, bool quiet)
    : label_(std::move(label)),
      active_(!quiet && isTerminal(STDERR_FILENO))
{
}

void FilesProgress::advance(std::int64_t files)
{
    done_ += files;
    const Clock::time_point now = Clock::now();
    if (!active_ || now < nextDraw_)
        return;
    nextDraw_ = now + std::chrono::milliseconds(100);
    draw(now);
}

void FilesProgress::hide()
{
    if (std::exchange(shown_, false)) {
        std::fputs("\r\x1b[K", stderr);
        std::fflush(stderr);
        nextDraw_ = Clock::now() + std::chrono::milliseconds(100);
    }
}

void FilesProgress::draw(Clock::time_point now)
{
    const double seconds = std::chrono::duration<double>(now - start_).count();
    const double rate = static_cast<double>(done_) / seconds;
    const std::int64_t total = std::max(total_.load(), std::int64_t{0});
    std::string text = fmt::format("{} files, {:.0f}/s", done_, rate);
    std::string bar;
    if (total >= done_ && done_ > 0) {
        const auto left = static_cast<std::int64_t>(static_cast<double>(total - done_) / rate + 0.5);
        text = fmt::format("{} of {} files, {:.0f}/s, {}:{:02} left", done_, total, rate, left / 60, left % 60);
        const int width = std::clamp(terminalColumns() - displayWidth(text) - displayWidth(label_) - 4, 0, 30);
        const int full =
            static_cast<int>(static_cast<double>(width) * static_cast<double>(done_) / static_cast<double>(total));
        bar = fmt::format("{:█<{}}{:░<{}} ", "", full, "", width - full);
    }
    std::fputs(fmt::format("\r{} {}{}\x1b[K", label_, bar, text).c_str(), stderr);
    std::fflush(stderr);
    shown_ = true;
}
