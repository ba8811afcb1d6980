// ktfiles tags copy: copies every kind of loop chunk from one file to others, between AIFF and CAF in either direction.
#include "loops/tags/LoopTagsCopy.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/FileLocation.h"
#include "tool/shared/looptags/LoopTagFiles.h"
#include "tool/shared/looptags/LoopTagsEdit.h"
#include "tool/tags/TagsCommand.h"

namespace {

struct CopyArguments {
    std::string from;
    FileArguments to;
    EditOptions options;
};

bool runCopy(const CopyArguments& arguments, const OutputOptions& output)
{
    std::shared_ptr<const LoopSource> source;
    if (!reportingFailures(arguments.from, [&] {
            const FileAccess access = accessForReading(arguments.from, arguments.options.waiting());
            platform::Error error;
            source = readLoopSource(fileLocation(arguments.from), &error);
            if (source == nullptr)
                failForTags(arguments.from, error);
            if (source->isEmpty())
                throw Failure("has no loop tags");
        }))
        return false;
    const TagsEditor editor{"copy", "copied", "would copy",
                            [&](const LoopTags& before, const platform::URLRef& target, platform::Error* error) {
                                return planLoopTagsCopy(source, before, target, error);
                            }};
    return editTags(arguments.to, editor, arguments.options, output);
}

} // namespace

void declareTagsCopy(CommandLine& commandLine, Verb& tags)
{
    static CopyArguments arguments;
    Verb& verb = commandLine.addVerb(
        "copy", "Copy all that makes a loop to other files",
        [&commandLine] { return runCopy(arguments, commandLine.output()); }, &tags);
    CommandLine::addFile(verb, arguments.from, "FROM").required().describe("The file to copy from");
    CommandLine::addFiles(verb, arguments.to, "TO").describe("The files to copy to");
    CommandLine::addEditOptions(verb, arguments.options);
}
