// What the verbs that tell of several files have in common: the walk over them, by several threads, in their order.
#pragma once

#include "tool/shared/input/FileArguments.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/output/Output.h"
#include "tool/shared/output/ShownName.h"

#include <functional>
#include <memory>
#include <vector>

/// How files are gone through.
struct FileLoop {
    unsigned threads = 1;          // 0: one per core
    const char* doing = "reading"; // for people who wait
    bool quiet = false;
};

/// The second half of the work on a file, which tells of the first: in the order of the files, by the thread that
/// called. Throws Failure.
using FileRest = std::function<void()>;
/// The first half, by any thread, on several files at once. Throws Failure.
using FileStart = std::function<FileRest(const FoundFile& file)>;
/// Takes what is wrong with a file, which standard error says too.
using FileFailure = std::function<void(const std::string& path, const std::string& text)>;

/// Works on all files, those below folders too. One for which that throws Failure goes to `fail`, unless it is passed
/// over. False when a file failed, or the list of files. Says on standard error, unless quiet, when no folder held a
/// file for the verb.
bool forEachFile(const FileArguments& files, const FileLoop& loop, const FileStart& start, const FileFailure& fail);
/// Files that are known ahead; `name` is that of the first argument.
struct FoundFiles {
    std::string name;
    std::vector<FoundFile> files;
};
bool forEachFile(const FoundFiles& found, const FileLoop& loop, const FileStart& start, const FileFailure& fail);

/// Gives the writer, by its `add`, what `read` says of each file; of one that failed the problem, by `addFailure`. Ends
/// with the writer's `finish`. False when a file failed. `read` is called by any thread.
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
