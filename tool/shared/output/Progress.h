// Progress of work on one file, in bytes or frames.
#pragma once

#include "tool/shared/output/FilesProgress.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

/// A part of the progress on many files if that is shown, else a line of its own.
class Progress {
public:
    /// `total` is the number of bytes; `doing` names the work. It and `path` are used for a line of its own.
    Progress(std::string doing, std::int64_t total, bool quiet, const std::string& path = {});
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    void advance(std::int64_t bytes);

private:
    std::optional<FilesProgress> own_;
    FilesProgress* line_;
    std::int64_t total_;
    std::int64_t done_ = 0;
};

/// The progress of each copy that the library reports.
std::function<void(std::int64_t done, std::int64_t all)> copyProgress(std::string path, bool quiet);
