// What the verbs that tell of several files have in common.
#pragma once

#include "tool/shared/input/FileArguments.h"
#include "tool/shared/input/FoundFile.h"
#include "tool/shared/output/Output.h"

#include <functional>
#include <vector>

/// Works on a file; throws Failure.
using FileWork = std::function<void(const FoundFile& file)>;
/// Takes what is wrong with a file, which standard error says too.
using FileFailure = std::function<void(const std::string& path, const std::string& text)>;

/// Hands all files to `work`, those below folders too. One for which that throws Failure goes to `fail`, unless it is
/// passed over. False when a file failed, or the list of files. Says on standard error, unless quiet, when no folder
/// held a file for the verb.
bool forEachFile(const FileArguments& files, const OutputOptions& options, const FileWork& work,
                 const FileFailure& fail);
/// Files that are known ahead; `name` is that of the first argument.
struct FoundFiles {
    std::string name;
    std::vector<FoundFile> files;
};
bool forEachFile(const FoundFiles& found, const OutputOptions& options, const FileWork& work, const FileFailure& fail);

/// Gives the writer, by its `add`, what `read` says of each file; of one that failed the problem, by `addFailure`. Ends
/// with the writer's `finish`. False when a file failed.
template <class Writer, class Files, class Read>
bool writeFileByFile(Writer& writer, const Files& files, const OutputOptions& options, Read read)
{
    const bool good = forEachFile(
        files, options, [&](const FoundFile& file) { writer.add(file.path, read(file)); },
        [&](const std::string& path, const std::string& text) { writer.addFailure(path, text); });
    writer.finish();
    return good;
}
