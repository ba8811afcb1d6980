// ktfiles meta set and remove.
#include "tool/meta/MeasuredFields.h"
#include "tool/meta/MetaCommand.h"
#include "tool/meta/MetaEdits.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/QuotedText.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <algorithm>
#include <sys/stat.h>

namespace {

struct EditArguments {
    std::vector<std::string> words;
    FileArguments files; // files of the list; the others are among the words
    bool isLenient = false;
    MeasuredFields measured;
    EditOptions options;
};

std::string meantText(std::string_view text)
{
    if (!isQuoted(text))
        return std::string(text);
    std::string meant = takeQuotedText(text);
    if (!text.empty())
        throw UsageError("\"" + printable(text) + "\" follows a value in $'…'");
    return meant;
}

void addStep(std::vector<MetaStep>& steps, MetaStep step)
{
    for (const MetaStep& other : steps)
        if (other.name.text == step.name.text && other.text != step.text)
            throw UsageError(printable(step.name.text) + " is set twice, to different values");
    if (std::ranges::none_of(steps, [&](const MetaStep& other) { return other.name.text == step.name.text; }))
        steps.push_back(std::move(step));
}

/// A word with "=" and no "/" before it is a field with its value; other words are files.
std::vector<MetaStep> takeAssignments(EditArguments& arguments)
{
    std::vector<MetaStep> steps;
    for (const std::string& word : arguments.words) {
        const std::size_t equals = word.find('=');
        if (equals == std::string::npos || word.find('/') < equals)
            arguments.files.names.push_back(word);
        else
            addStep(steps, metaStep(word.substr(0, equals), meantText(std::string_view(word).substr(equals + 1)),
                                    arguments.isLenient));
    }
    if (steps.empty() && !arguments.measured.any())
        throw UsageError("FIELD=VALUE is missing; fields are those that ktfiles meta prints");
    return steps;
}

/// Any name is possible under "info" and "ixml", so an existing file of that name takes precedence.
bool isOpenName(const std::string& word)
{
    return word.starts_with("info.") || word.starts_with("ixml.");
}

std::vector<MetaStep> takeNames(EditArguments& arguments)
{
    std::vector<MetaStep> steps;
    for (const std::string& word : arguments.words) {
        struct stat status = {};
        const bool hasSlash = word.find('/') != std::string::npos;
        const bool isThere = ::lstat(nameMeantBy(word).c_str(), &status) == 0;
        if (!hasSlash && isEditedField(word) && !(isThere && isOpenName(word)))
            addStep(steps, metaStep(word, std::nullopt, arguments.isLenient));
        else if (hasSlash || isThere)
            arguments.files.names.push_back(word);
        else // a misspelt field must not pass for a missing file
            throw UsageError("\"" + printable(word) + "\" is neither a file nor a field to edit" + whyNotEdited(word));
    }
    if (steps.empty())
        throw UsageError("FIELD is missing; fields are those that ktfiles meta prints");
    return steps;
}

bool editFiles(EditArguments& arguments, const std::vector<MetaStep>& steps, const MetaEditWords& words,
               const OutputOptions& output)
{
    std::vector<std::string> files;
    if (!reportingRecord(arguments.files.listName(), output, [&] { files = allNames(arguments.files); }))
        return false;
    MetaEdits edits(words, arguments.options, output);
    for (const std::string& path : files)
        edits.edit(path, [&](const std::string& target) {
            return planMeasured(target, steps, arguments.measured, arguments.isLenient, output.quiet);
        });
    return edits.finish();
}

bool runSet(EditArguments& arguments, const OutputOptions& output)
{
    const std::vector<MetaStep> steps = takeAssignments(arguments);
    requireNotTyped(arguments.measured, steps);
    return editFiles(arguments, steps, {"set", "set", "would set"}, output);
}

bool runRemove(EditArguments& arguments, const OutputOptions& output)
{
    const std::vector<MetaStep> steps = takeNames(arguments);
    return editFiles(arguments, steps, {"remove", "removed", "would remove"}, output);
}

Verb& declareEdit(CommandLine& commandLine, Verb& meta, const std::string& name, const std::string& description,
                  const std::string& words, EditArguments& arguments, bool (*run)(EditArguments&, const OutputOptions&))
{
    Verb& verb = commandLine.addVerb(
        name, description, [&commandLine, &arguments, run] { return run(arguments, commandLine.output()); }, &meta);
    CommandLine::addFiles(verb, arguments.words).describe(words);
    CommandLine::addFileList(verb, arguments.files);
    CommandLine::addEditOptions(verb, arguments.options);
    return verb;
}

} // namespace

void declareMetaEdits(CommandLine& commandLine, Verb& meta)
{
    static EditArguments toSet, toRemove;
    Verb& set = declareEdit(commandLine, meta, "set", "Set fields of WAVE, AIFF and CAF files; what is not named stays",
                            "The audio files, and FIELD=VALUE for each field, as in bext.description=Take, "
                            "bext.timeReference=01:00:00:00@25, cue[new].position=1:02.5",
                            toSet, runSet);
    set.addFlag("--lenient", toSet.isLenient,
                "Take what the standards do not: texts that are not ASCII, other dates, unknown ids");
    set.addFlag("--loudness", toSet.measured.loudness,
                "Measure the loudness of WAVE files by EBU R 128, and set the five fields of bext that tell of it");
    set.addFlag("--md5", toSet.measured.md5, "Set md5 of WAVE files, by which info --check knows their sound again");
    declareEdit(commandLine, meta, "remove", "Remove fields, items of lists, or whole chunks by their group",
                "The audio files, and the FIELDs to remove, as in info.ISFT, cue[2], bext", toRemove, runRemove);
}
