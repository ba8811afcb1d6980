// ktfiles tags set and remove: the same edit with values and without.
#include "loops/tags/LoopTagsSetting.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/looptags/LoopTagArguments.h"
#include "tool/shared/looptags/LoopTagsEdit.h"
#include "tool/tags/TagsCommand.h"

namespace {

struct SetArguments {
    std::vector<std::string> words;
    FileArguments files; // files of the list; the others are among the words
    EditOptions options;
};

bool runSet(SetArguments& arguments, const OutputOptions& output)
{
    const TagArguments parsed = parseAssignments(arguments.words);
    arguments.files.names = parsed.files;
    const TagsEditor editor{"set", "set", "would set",
                            [&](const LoopTags& before, const platform::URLRef& file, platform::Error* error) {
                                return planLoopTagAssignments(before, file, parsed.assignments, error);
                            }};
    return editTags(arguments.files, editor, arguments.options, output);
}

bool runRemove(SetArguments& arguments, const OutputOptions& output)
{
    const TagArguments parsed = parseKeys(arguments.words);
    arguments.files.names = parsed.files;
    const TagsEditor editor{"remove", "removed", "would remove",
                            [&](const LoopTags& before, const platform::URLRef& file, platform::Error* error) {
                                return parsed.assignments.empty()
                                           ? planLoopTagsRemoval(before, file, error)
                                           : planLoopTagAssignments(before, file, parsed.assignments, error);
                            }};
    return editTags(arguments.files, editor, arguments.options, output);
}

void declareEdit(CommandLine& commandLine, Verb& tags, const std::string& name, const std::string& description,
                 const std::string& words, SetArguments& arguments, bool (*run)(SetArguments&, const OutputOptions&))
{
    Verb& verb = commandLine.addVerb(
        name, description, [&commandLine, &arguments, run] { return run(arguments, commandLine.output()); }, &tags);
    CommandLine::addFiles(verb, arguments.words).describe(words);
    CommandLine::addFileList(verb, arguments.files);
    CommandLine::addEditOptions(verb, arguments.options);
}

} // namespace

void declareTagsSet(CommandLine& commandLine, Verb& tags)
{
    static SetArguments toSet;
    declareEdit(commandLine, tags, "set", "Set tags; what is not named stays",
                "The audio files, and KEY=VALUE for each tag, as in genre=Jazz, key=F#, signature=4/4", toSet, runSet);
}

void declareTagsRemove(CommandLine& commandLine, Verb& tags)
{
    static SetArguments toRemove;
    declareEdit(commandLine, tags, "remove", "Remove tags, or without keys everything that makes a loop",
                "The audio files, and the KEYs of the tags to remove", toRemove, runRemove);
}
