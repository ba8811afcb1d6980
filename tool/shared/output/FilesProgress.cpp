#include "tool/shared/output/FilesProgress.h"

#include "tool/shared/edits/EndingSignals.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/ProgressLine.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/format.h>

#include <algorithm>
#include <unistd.h>
#include <utility>

namespace {

constexpr std::chrono::seconds kQuietBeginning{1};

std::atomic<FilesProgress*> shown = nullptr; // the outermost one
thread_local double partsOfThread = 0;

std::string timeText(double seconds)
{
    const auto left = static_cast<std::int64_t>(seconds + 0.5);
    return left < 3600 ? fmt::format("{}:{:02}", left / 60, left % 60)
                       : fmt::format("{}:{:02}:{:02}", left / 3600, left / 60 % 60, left % 60);
}

std::string barText(int width, double part)
{
    const int full = static_cast<int>(part * width);
    return fmt::format("{:█<{}}{:░<{}}", "", full, "", width - full);
}

} // namespace

FilesProgress::FilesProgress(std::string doing, bool quiet)
    : doing_(std::move(doing)),
      active_(!quiet && isTerminal(STDERR_FILENO))
{
    FilesProgress* none = nullptr;
    if (active_ && shown.compare_exchange_strong(none, this))
        removeTemporaryFilesAtEndingSignals(); // these signals clear the line too
}

FilesProgress::~FilesProgress()
{
    FilesProgress* self = this;
    if (shown.compare_exchange_strong(self, nullptr)) {
        const progressline::Cleared cleared;
    }
}

FilesProgress* FilesProgress::current()
{
    return shown;
}

void FilesProgress::begin(const std::string& path)
{
    if (!active_)
        return;
    const std::lock_guard lock(nameMutex_);
    name_ = path;
}

double FilesProgress::takeParts()
{
    return std::exchange(partsOfThread, 0);
}

void FilesProgress::addPart(double part)
{
    partsOfThread += part;
    parts_ += part;
    draw();
}

void FilesProgress::advance(std::int64_t files, double parts)
{
    done_ += files;
    parts_ -= parts;
    if (total_ == 0 || done_ < total_) // otherwise the work is done
        draw();
}

void FilesProgress::draw()
{
    if (active_ && shown == this && Clock::now() - start_ >= kQuietBeginning)
        progressline::draw([this](int columns) { return text(columns); });
}

std::string FilesProgress::text(int columns)
{
    const double seconds = std::chrono::duration<double>(Clock::now() - start_).count();
    const std::int64_t total = total_, done = done_;
    const double part =
        total <= 0 ? 0 : std::clamp((static_cast<double>(done) + parts_) / static_cast<double>(total), 0., 1.);
    const std::string left = part > 0 ? ", " + timeText(seconds * (1 - part) / part) + " left" : "";
    const std::string numbers = total == 1  ? fmt::format("{:.0f}%", part * 100)
                                : total > 1 ? fmt::format("{} of {} files", done, total)
                                            : fmt::format("{} files", done);
    std::string name;
    {
        const std::lock_guard lock(nameMutex_);
        name = printableOnError(shownName(name_));
    }
    constexpr int gap = 2, leastName = 12, leastBar = 5, mostBar = 30;
    std::string words = fmt::format("{} {}", doing_, numbers);
    words = shortened(displayWidth(words + left) <= columns ? words + left : words, columns);
    int room = columns - displayWidth(words) - gap;
    const int barRoom = part > 0 ? std::min(room - leastName - gap, mostBar) : 0;
    const std::string bar = barRoom >= leastBar ? barText(barRoom, part) : "";
    room -= bar.empty() ? 0 : barRoom + gap;
    name = room >= leastName ? shortened(name, room) : "";
    return fmt::format("{}{:{}}{}{:{}}{}", words, "", bar.empty() ? 0 : gap, bar, "", name.empty() ? 0 : gap, name);
}
