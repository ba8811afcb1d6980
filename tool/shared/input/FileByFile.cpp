#include "tool/shared/input/FileByFile.h"

#include "tool/shared/input/FolderWalk.h"

#include <algorithm>

namespace {

/// One walk over files.
class FileLoop {
public:
    FileLoop(const FileWork& work, const FileFailure& fail) : work_(work), fail_(fail) {}

    /// False when no more is wanted.
    bool visit(const FoundFile& file)
    {
        try {
            if (!file.problem.empty())
                throw Failure(file.problem);
            work_(file);
            hasAny_ = true;
        } catch (const ToldFailure& failure) {
            take(file.path, failure.what());
        } catch (const Failure& failure) {
            if (!isPassedOver(file, failure))
                fail(file.path, failure.what());
        }
        return !Output::standard().failed();
    }
    void fail(const std::string& path, const std::string& text)
    {
        take(path, text);
        reportFailure(path, text);
    }
    /// Nothing was there: neither a file to work on nor one that failed.
    void tellIfNone(const std::string& folder, bool quiet) const
    {
        if (!hasAny_ && !quiet && !Output::standard().failed())
            reportFailure(folder, "no file for this verb is there");
    }
    bool isGood() const { return isGood_; }

private:
    void take(const std::string& path, const std::string& text)
    {
        isGood_ = false;
        hasAny_ = true;
        fail_(path, text);
    }

    const FileWork& work_;
    const FileFailure& fail_;
    bool hasAny_ = false;
    bool isGood_ = true;
};

} // namespace

bool forEachFile(const FileArguments& files, const OutputOptions& options, const FileWork& work,
                 const FileFailure& fail)
{
    FileLoop loop(work, fail);
    std::vector<std::string> names;
    try {
        names = allNames(files);
    } catch (const Failure& failure) {
        loop.fail(files.listName(), failure.what());
        return false;
    }
    if (files.takesFolders)
        FolderWalk(names, [&](const FoundFile& file) { return loop.visit(file); }).run();
    else
        std::ranges::all_of(names, [&](const std::string& name) { return loop.visit({name, {}}); });
    loop.tellIfNone(names.front(), options.quiet);
    return loop.isGood();
}

bool forEachFile(const FoundFiles& found, const OutputOptions& options, const FileWork& work, const FileFailure& fail)
{
    FileLoop loop(work, fail);
    std::ranges::all_of(found.files, [&](const FoundFile& file) { return loop.visit(file); });
    loop.tellIfNone(found.name, options.quiet);
    return loop.isGood();
}
