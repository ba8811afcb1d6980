// ktfiles project: project packages, their metadata, media, folders and backups.
#include "platform/ApplicationInfo.h"
#include "tool/project/ProjectArguments.h"
#include "tool/project/ProjectBackup.h"
#include "tool/project/ProjectEdit.h"
#include "tool/project/ProjectMedia.h"
#include "tool/project/ProjectPackage.h"
#include "tool/project/ProjectReport.h"
#include "tool/project/ProjectRestore.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/TimeoutOption.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"

#include <limits>

namespace {

/// Reports failures on standard error, and in the JSON if that is requested.
bool runOn(const std::string& path, const OutputOptions& output, const std::function<void()>& work)
{
    if (path.empty())
        throw MissingArgument("PACKAGE");
    platform::setApplicationInfo({"ktfiles", KTFILES_VERSION});
    return reportingRecord(path, output, work);
}

void backUp(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, arguments.wait, [&](const std::string& package) {
        const auto project = openProject(package);
        const long alternative = alternativeOf(*project, arguments.alternative);
        const std::string name = makeBackup(*project, alternative, arguments.keep, arguments.edit.dryRun, output.quiet);
        const auto members = [&](JsonWriter& json) {
            json.member("alternative", alternative).member("dryRun", arguments.edit.dryRun);
            if (!name.empty())
                json.member("backup", name);
        };
        printProjectEdit(arguments.package, output, members,
                         name.empty() ? fmt::format("would copy alternative {} to a new backup", alternative)
                                      : fmt::format("copied alternative {} to backup {}", alternative, name));
    });
}

void renameAlternative(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, arguments.wait, [&](const std::string& package) {
        const auto project = openProject(package);
        const auto url =
            ProjectInformation::projectInformationURLForBundleURL(project->projectURL(), CreateDirectories::no);
        SafeEdit edit(url->posixPath(), arguments.edit); // before reading, so that other changes are noticed
        auto info = ProjectInformation::infoDictionaryFromProjectBundleURL(project->projectURL());
        auto names = project->alternativeNames();
        const auto found = names.find(std::to_string(arguments.index));
        if (!info)
            throw Failure("Resources/ProjectInformation.plist holds a value that would not be kept");
        if (found == names.end())
            throw Failure(fmt::format("has no alternative {}", arguments.index));
        const std::string before = project->variationNameForIndex(arguments.index).value_or("");
        found->second = arguments.name;
        (*info)[ProjectInfoKey::variantNames] = std::move(names);
        std::string backup;
        if (!arguments.edit.dryRun)
            backup = edit.apply(EditScope::wholeFile(), [&](const std::string& path) {
                platform::Error error;
                const auto target = platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path),
                                                                            platform::PathStyle::posix, false);
                if (!ProjectInformation::writeInfoDictionaryToURL(
                        ProjectInformation::infoDictionaryForProjectBundleURL(*info, project->projectURL()), target,
                        &error))
                    throw Failure(error.description);
            });
        const auto members = [&](JsonWriter& json) {
            json.member("alternative", arguments.index).member("name", arguments.name).member("before", before);
            json.member("dryRun", arguments.edit.dryRun);
            if (!backup.empty())
                json.member("backup", backup);
        };
        printProjectEdit(arguments.package, output, members,
                         fmt::format("alternative {} {} \"{}\"{}", arguments.index,
                                     arguments.edit.dryRun ? "would be called" : "is called", printable(arguments.name),
                                     backup.empty() ? "" : ", the old names are in " + printable(backup)));
    });
}

void addPackage(Verb& verb, ProjectArguments& arguments)
{
    CommandLine::addFile(verb, arguments.package, "PACKAGE").describe("The project package");
}

constexpr std::pair<long, long> kIndexes{0, std::numeric_limits<std::uint32_t>::max()};

void addAlternative(Verb& verb, ProjectArguments& arguments)
{
    verb.addNumber("--alternative", arguments.alternative, kIndexes, "The alternative's number, else the active one");
}

void declareReading(CommandLine& commandLine, Verb& project, ProjectArguments& arguments)
{
    const OutputOptions& output = commandLine.output();
    Verb& media = commandLine.addVerb(
        "media", "List the media files that a project uses",
        [&] {
            return runOn(arguments.package, output, [&] {
                printProjectMedia(arguments.package, *openProject(arguments.package), arguments.alternative,
                                  arguments.missing, output);
            });
        },
        &project);
    addPackage(media, arguments);
    media.addFlag("--missing", arguments.missing, "Only those that are not there");
    media.addNumber("--alternative", arguments.alternative, kIndexes, "Only those of one alternative");

    Verb& dirs = commandLine.addVerb(
        "dirs", "List a project's media and working folders, or create them",
        [&] {
            return runOn(arguments.package, output, [&] {
                const auto print = [&](const std::string& package) {
                    printProjectDirectories(arguments.package, projectFolder(package), arguments.alternative,
                                            arguments.create, output);
                };
                if (arguments.create)
                    editProject(arguments.package, arguments.wait, print);
                else
                    print(arguments.package);
            });
        },
        &project);
    addPackage(dirs, arguments);
    dirs.addFlag("--create", arguments.create, "Create those that are missing");
    addAlternative(dirs, arguments);
    addTimeout(dirs, arguments.wait.timeoutSeconds);
}

void declareEdits(CommandLine& commandLine, Verb& project, ProjectArguments& arguments)
{
    const OutputOptions& output = commandLine.output();
    const auto edit = [&](const char* name, const char* description,
                          void (*work)(const ProjectArguments&, const OutputOptions&)) -> Verb& {
        Verb& verb = commandLine.addVerb(
            name, description,
            [&, work] {
                arguments.edit.quiet = arguments.wait.quiet = output.quiet;
                if (arguments.edit.timeout) // an option for edits of files, here for the package
                    arguments.wait.timeoutSeconds = arguments.edit.timeout;
                return runOn(arguments.package, output, [&] { work(arguments, output); });
            },
            &project);
        addPackage(verb, arguments);
        return verb;
    };
    Verb& backup = edit("backup", "Back up an alternative's project data", backUp);
    addAlternative(backup, arguments);
    backup.addNumber("--keep", arguments.keep, {1, kMostBackups},
                     "Delete the oldest backups, so that there are N with the new one");
    backup.addFlag("--dry-run", arguments.edit.dryRun, "Say what would be done, and do nothing");

    Verb& back = edit("restore", "Exchange an alternative's project data with a backup's", restoreBackup);
    back.addText("BACKUP", arguments.backup, "The backup's name, such as 03").label(" ").required();
    addAlternative(back, arguments);
    back.addFlag("--dry-run", arguments.edit.dryRun, "Say what would be done, and do nothing");

    Verb& settle = edit("settle", "Complete an exchange with a backup that was cut short, or undo it", settleExchange);
    const Argument undo = settle.addFlag("--undo", arguments.undo, "Put everything back to where it was");
    settle.addFlag("--forget", arguments.forget, "Leave everything where it is, and drop the record of the exchange")
        .excludes(undo);
    CommandLine::addPath(settle, "--with", arguments.backup,
                         "The backup's folder, where the record names one elsewhere")
        .label("FOLDER");
    addAlternative(settle, arguments);
    settle.addFlag("--dry-run", arguments.edit.dryRun, "Say what would be done, and do nothing");

    Verb& rename = edit("rename-alternative", "Give an alternative another name", renameAlternative);
    rename.addNumber("N", arguments.index, kIndexes, "The alternative's number").label(" ").required();
    rename.addText("NAME", arguments.name, "Its new name").label(" ").required();
    CommandLine::addEditOptions(rename, arguments.edit);

    for (Verb* const verb : {&backup, &back, &settle})
        addTimeout(*verb, arguments.wait.timeoutSeconds);
}

void declareProject(CommandLine& commandLine)
{
    static ProjectArguments arguments;
    Verb& verb = commandLine.addVerb("project", "Show what a project package holds; back up and restore it", [&] {
        return runOn(arguments.package, commandLine.output(),
                     [&] { printProject(arguments.package, *openProject(arguments.package), commandLine.output()); });
    });
    addPackage(verb, arguments);
    declareReading(commandLine, verb, arguments);
    declareEdits(commandLine, verb, arguments);
}

const VerbRegistration projectRegistration{65, "project", declareProject};

} // namespace
