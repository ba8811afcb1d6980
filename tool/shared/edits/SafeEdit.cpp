#include "tool/shared/edits/SafeEdit.h"

#include "tool/shared/access/FileLock.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/edits/EndingSignals.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

namespace {

FileAccess accessFor(const std::string& target, const EditOptions& options)
{
    using WritingOptions = platform::FileCoordinator::WritingOptions;
    return options.dryRun
               ? accessForReading(target, options.waiting())
               : accessForWriting(target, options.inPlace ? WritingOptions::none : WritingOptions::forReplacing,
                                  options.waiting());
}

} // namespace

SafeEdit::SafeEdit(const std::string& path, const EditOptions& options) : given_(path), options_(options)
{
    if (isFolder(path))
        throw Failure("is a folder, and edits take files only");
    const std::string target = resolvedPath(path);
    access_ = accessFor(target, options_);
    removeTemporaryFilesAtEndingSignals();
    const auto wait = [waiting = options.waiting()](int descriptor, const std::string& file) {
        waitForLock(descriptor, file, waiting);
        return kStatusOK;
    };
    FileProblem problem = edit_.Begin(target, {.inPlace = options.inPlace,
                                               .keepTimes = options.keepTimes,
                                               .backup = options.backup,
                                               .waitForLock = wait,
                                               .progress = copyProgress(path, options.quiet)});
    problem.name = asGiven(problem.name, path);
    requireNone(problem);
}

std::string SafeEdit::apply(const EditScope& scope, const std::function<void(const std::string& path)>& change)
{
    const FileProblem problem = edit_.Apply(scope, [&](const std::string& path) {
        change(path);
        return kStatusOK;
    });
    requireNone(edit_.Difference());
    requireNone(problem);
    return asGiven(edit_.Backup(), given_);
}
