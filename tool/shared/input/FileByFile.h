// Processes several files for a verb, on several threads, with results in order.
#pragma once

#include "tool/shared/input/FileArguments.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/output/Output.h"
#include "tool/shared/output/ShownName.h"

#include <functional>
#include <memory>
#include <vector>

/// How the files are processed.
struct FileLoop {
    unsigned threads = 1;          // 0: one per core
    const char* doing = "reading"; // shown while people wait
    bool quiet = false;
};

/// The second half of the work on a file, which reports the first: in the order of the files, on the calling thread.
/// Throws Failure.
using FileRest = std::function<void()>;
/// The first half, on any thread, for several files at once. Throws Failure.
using FileStart = std::function<FileRest(const FoundFile& file)>;
/// Receives the problem of a file, which is also on standard error.
using FileFailure = std::function<void(const std::string& path, const std::string& text)>;

/// Processes all files, including those in folders. A file for which that throws Failure is passed to `fail`, unless it
/// is skipped. False if a file or the list of files failed. Unless quiet, reports on standard error that no folder held
/// a file for the verb.
bool forEachFile(const FileArguments& files, const FileLoop& loop, const FileStart& start, const FileFailure& fail);
/// Files that are known in advance; `name` is that of the first argument.
struct FoundFiles {
    std::string name;
    std::vector<FoundFile> files;
};
bool forEachFile(const FoundFiles& found, const FileLoop& loop, const FileStart& start, const FileFailure& fail);

/// Passes the result of `read` for each file to the writer's `add`, or its problem to `addFailure`. Ends with the
/// writer's `finish`. False if a file failed. `read` is called on any thread.
template <class Writer, class Files, class Read>
bool writeFileByFile(Writer& writer, const Files& files, const FileLoop& loop, Read read)
{
    const bool good = forEachFile(
        files, loop,
        [&](const FoundFile& file) -> FileRest {
            using Result = std::invoke_result_t<Read&, const FoundFile&>;
            const auto result = std::make_shared<Result>(read(file));
            return [&writer, path = shownName(file.path), result] { writer.add(path, *result); };
        },
        [&](const std::string& path, const std::string& text) { writer.addFailure(path, text); });
    writer.finish();
    return good;
}
