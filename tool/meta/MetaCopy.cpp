// ktfiles meta copy: fields from one file to others.
#include "tool/meta/MetaCommand.h"
#include "tool/meta/MetaCopySource.h"
#include "tool/meta/MetaEdits.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/output/Failure.h"

namespace {

struct CopyArguments {
    std::string from, only;
    FileArguments to;
    bool isLenient = false;
    EditOptions options;
};

bool runCopy(const CopyArguments& arguments, const OutputOptions& output)
{
    const MetaGroups groups = arguments.only.empty() ? MetaGroups() : metaGroupsFromText(arguments.only);
    std::optional<MetaCopySource> source;
    std::vector<std::string> files;
    const auto read = [&] {
        const FileAccess access = accessForReading(arguments.from, arguments.options.waiting());
        source.emplace(arguments.from, groups);
        if (source->isEmpty())
            throw Failure("has no fields that can be copied");
    };
    if (!reportingRecord(arguments.from, output, read) ||
        !reportingRecord(arguments.to.listName(), output, [&] { files = allNames(arguments.to); }))
        return false;
    MetaEdits edits({"copy", "copied", "would copy"}, arguments.options, output);
    for (const std::string& path : files)
        edits.edit(path, [&](const std::string& target) {
            MetaPlan plan = planMetadata(
                target, [&](const HeldMetadata& held) { return source->stagesFor(held, arguments.isLenient); },
                arguments.isLenient);
            plan.left = source->leftFrom(plan.before.container);
            return plan;
        });
    return edits.finish();
}

} // namespace

void declareMetaCopy(CommandLine& commandLine, Verb& meta)
{
    static CopyArguments arguments;
    Verb& verb = commandLine.addVerb(
        "copy", "Copy the fields that can be set to other files",
        [&commandLine] { return runCopy(arguments, commandLine.output()); }, &meta);
    CommandLine::addFile(verb, arguments.from, "FROM").required().describe("The file to copy from");
    CommandLine::addFiles(verb, arguments.to, "TO").describe("The files to copy to");
    verb.addText("--only", arguments.only, "Only these, behind commas: bext, ixml, info, cue, smpl, …").label("GROUPS");
    verb.addFlag("--lenient", arguments.isLenient,
                 "Take what the standards do not: texts that are not ASCII, unknown ids, places behind the end");
    CommandLine::addEditOptions(verb, arguments.options);
}
