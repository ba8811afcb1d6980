#include "tool/shared/output/Progress.h"

#include <algorithm>
#include <memory>
#include <utility>

Progress::Progress(std::string doing, std::int64_t total, bool quiet, const std::string& path)
    : line_(FilesProgress::current()),
      total_(std::max<std::int64_t>(total, 1))
{
    if (line_ != nullptr || quiet)
        return;
    line_ = &own_.emplace(std::move(doing), quiet);
    line_->setTotal(1);
    line_->begin(path);
}

void Progress::advance(std::int64_t bytes)
{
    const std::int64_t before = std::exchange(done_, std::min(done_ + bytes, total_));
    if (line_ != nullptr)
        line_->addPart(static_cast<double>(done_ - before) / static_cast<double>(total_));
}

std::function<void(std::int64_t done, std::int64_t all)> copyProgress(std::string path, bool quiet)
{
    struct Copy {
        std::optional<Progress> progress;
        std::int64_t done = 0;
    };
    return [copy = std::make_shared<Copy>(), path = std::move(path), quiet](std::int64_t done, std::int64_t all) {
        if (!copy->progress) {
            copy->progress.emplace("copying", all, quiet, path);
            copy->done = 0;
        }
        copy->progress->advance(done - std::exchange(copy->done, done));
        if (done == all)
            copy->progress.reset();
    };
}
