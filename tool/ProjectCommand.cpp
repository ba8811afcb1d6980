// ktfiles project: project packages, what they say of themselves, their media, folders and backups.
#include "CommandLine.h"
#include "Failure.h"
#include "ProjectBackup.h"
#include "ProjectEdit.h"
#include "ProjectMedia.h"
#include "ProjectPackage.h"
#include "ProjectReport.h"
#include "platform/ApplicationInfo.h"

#include <nlohmann/json.hpp>

#include <filesystem>
#include <limits>

namespace {

constexpr int kMostBackups = 100; // that two digits name

struct ProjectArguments {
    std::string package, backup, name;
    std::optional<long> alternative;
    long index = 0;
    int keep = 0;
    bool missing = false;
    bool create = false;
    EditOptions edit;
};

/// Failures go to standard error, and into the JSON where that is asked for.
bool runOn(const std::string& path, const OutputOptions& output, const std::function<void()>& work)
{
    if (path.empty())
        throw CLI::RequiredError("PACKAGE");
    platform::setApplicationInfo({"ktfiles", KTFILES_VERSION});
    return reportingFailures(path, [&] {
        try {
            work();
        } catch (const Failure& failure) {
            if (output.json)
                Output::standard().print("{}\n", jsonText({{"path", path}, {"error", failure.what()}}));
            throw;
        }
    });
}

/// `json` without the path; `sentence` for people and pipes alike.
void report(const std::string& path, const OutputOptions& options, nlohmann::ordered_json json,
            const std::string& sentence)
{
    if (options.json) {
        nlohmann::ordered_json object{{"path", path}};
        object.update(json);
        Output::standard().print("{}\n", jsonText(object));
    } else if (!options.quiet) {
        Output::standard().print("{}: {}\n", printable(path), sentence);
    }
}

void backUp(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, [&] {
        const auto project = openProject(arguments.package);
        const long alternative = alternativeOf(*project, arguments.alternative);
        const auto purge = arguments.keep > 0 ? PurgeOldBackups::yes : PurgeOldBackups::no;
        const std::string name = makeBackup(*project, alternative, arguments.keep > 0 ? arguments.keep : kMostBackups,
                                            purge, arguments.edit.dryRun, output.quiet);
        nlohmann::ordered_json json{{"alternative", alternative}, {"dryRun", arguments.edit.dryRun}};
        if (!name.empty())
            json["backup"] = name;
        report(arguments.package, output, json,
               name.empty() ? fmt::format("would copy alternative {} to a new backup", alternative)
                            : fmt::format("copied alternative {} to backup {}", alternative, name));
    });
}

platform::URLRef backupNamed(const ProjectInformation& project, long alternative, const std::string& name)
{
    const auto base =
        ProjectInformation::backupsBaseURLForBundleURL(project.projectURL(), alternative, CreateDirectories::no);
    const bool isName = !name.starts_with('.') && name.find('/') == name.npos;
    auto url = base && isName ? base->appendingPathComponent(platform::String::fromUTF8(name), true) : nullptr;
    if (!url || !std::filesystem::is_directory(url->posixPath()))
        throw Failure(fmt::format("alternative {} has no backup \"{}\"", alternative, name));
    return url;
}

void restore(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, [&] {
        const auto project = openProject(arguments.package);
        const long alternative = alternativeOf(*project, arguments.alternative);
        const platform::URLRef backup = backupNamed(*project, alternative, arguments.backup);
        const auto interrupted =
            ProjectInformation::interruptedExchangeForBundleURL(project->projectURL(), alternative);
        const bool completes = interrupted && *interrupted->backupURL == *backup;
        platform::Error error;
        if (!arguments.edit.dryRun &&
            !ProjectInformation::exchangeDataOfProjectAtURL(project->projectURL(), alternative, backup, &error))
            throw Failure(error.description);
        std::string sentence;
        if (interrupted)
            sentence = fmt::format("found an exchange with backup {} that was cut short; {}; ",
                                   backupName(interrupted->backupURL),
                                   arguments.edit.dryRun ? (completes ? "would complete it" : "would undo it")
                                   : completes           ? "completed it"
                                                         : "undid it");
        sentence += fmt::format("alternative {} {} the data of backup {}, which {} what the alternative had",
                                alternative, arguments.edit.dryRun ? "would have" : "has", backupName(backup),
                                arguments.edit.dryRun ? "would have" : "has");
        nlohmann::ordered_json json{
            {"alternative", alternative}, {"backup", backupName(backup)}, {"dryRun", arguments.edit.dryRun}};
        if (interrupted)
            json["interruptedExchange"] = backupName(interrupted->backupURL);
        report(arguments.package, output, json, printable(sentence));
    });
}

void renameAlternative(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, [&] {
        const auto project = openProject(arguments.package);
        const auto url =
            ProjectInformation::projectInformationURLForBundleURL(project->projectURL(), CreateDirectories::no);
        SafeEdit edit(url->posixPath(), arguments.edit); // ahead of the reading, so that it notices other changes
        auto info = ProjectInformation::infoDictionaryFromProjectBundleURL(project->projectURL());
        auto names = project->alternativeNames();
        const auto found = names.find(std::to_string(arguments.index));
        if (!info || found == names.end())
            throw Failure(fmt::format("has no alternative {}", arguments.index));
        const std::string before = project->variationNameForIndex(arguments.index).value_or("");
        found->second = arguments.name;
        (*info)[ProjectInfoKey::variantNames] = std::move(names);
        std::string backup;
        if (!arguments.edit.dryRun)
            backup = edit.apply([&](const std::string& path) {
                platform::Error error;
                const auto target = platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path),
                                                                            platform::PathStyle::posix, false);
                if (!ProjectInformation::writeInfoDictionaryToURL(
                        ProjectInformation::infoDictionaryForProjectBundleURL(*info, project->projectURL()), target,
                        &error))
                    throw Failure(error.description);
            });
        nlohmann::ordered_json json{{"alternative", arguments.index},
                                    {"name", arguments.name},
                                    {"before", before},
                                    {"dryRun", arguments.edit.dryRun}};
        if (!backup.empty())
            json["backup"] = backup;
        report(arguments.package, output, json,
               fmt::format("alternative {} {} \"{}\"{}", arguments.index,
                           arguments.edit.dryRun ? "would be called" : "is called", printable(arguments.name),
                           backup.empty() ? "" : ", the old names are in " + printable(backup)));
    });
}

void addPackage(CLI::App& verb, ProjectArguments& arguments)
{
    CommandLine::addFile(verb, arguments.package, "PACKAGE")->description("The project package");
}

CLI::Validator indexRange()
{
    return CLI::Range(0L, long{std::numeric_limits<std::uint32_t>::max()}).description("");
}

void addAlternative(CLI::App& verb, ProjectArguments& arguments)
{
    verb.add_option("--alternative", arguments.alternative, "The alternative's number, else the active one")
        ->option_text("N")
        ->check(indexRange());
}

void declareReading(CommandLine& commandLine, CLI::App& project, ProjectArguments& arguments)
{
    const OutputOptions& output = commandLine.output();
    CLI::App& media = commandLine.addVerb(
        "media", "List the media files that a project uses",
        [&] {
            return runOn(arguments.package, output, [&] {
                printProjectMedia(arguments.package, *openProject(arguments.package), arguments.alternative,
                                  arguments.missing, output);
            });
        },
        &project);
    addPackage(media, arguments);
    media.add_flag("--missing", arguments.missing, "Only those that are not there");
    media.add_option("--alternative", arguments.alternative, "Only those of one alternative")
        ->option_text("N")
        ->check(indexRange());

    CLI::App& dirs = commandLine.addVerb(
        "dirs", "List a project's media and working folders, or create them",
        [&] {
            return runOn(arguments.package, output, [&] {
                const auto print = [&] {
                    printProjectDirectories(arguments.package, arguments.alternative, arguments.create, output);
                };
                if (arguments.create)
                    editProject(arguments.package, print);
                else
                    print();
            });
        },
        &project);
    addPackage(dirs, arguments);
    dirs.add_flag("--create", arguments.create, "Create those that are missing");
    addAlternative(dirs, arguments);
}

void declareEdits(CommandLine& commandLine, CLI::App& project, ProjectArguments& arguments)
{
    const OutputOptions& output = commandLine.output();
    const auto edit = [&](const char* name, const char* description,
                          void (*work)(const ProjectArguments&, const OutputOptions&)) -> CLI::App& {
        CLI::App& verb = commandLine.addVerb(
            name, description,
            [&, work] {
                arguments.edit.quiet = output.quiet;
                return runOn(arguments.package, output, [&] { work(arguments, output); });
            },
            &project);
        addPackage(verb, arguments);
        return verb;
    };
    CLI::App& backup = edit("backup", "Back up an alternative's project data", backUp);
    addAlternative(backup, arguments);
    backup.add_option("--keep", arguments.keep, "Delete the oldest backups, so that there are N with the new one")
        ->option_text("N")
        ->check(CLI::Range(1, kMostBackups).description(""));
    backup.add_flag("--dry-run", arguments.edit.dryRun, "Say what would be done, and do nothing");

    CLI::App& back = edit("restore", "Exchange an alternative's project data with a backup's", restore);
    back.add_option("BACKUP", arguments.backup, "The backup's name, such as 03")->option_text(" ")->required();
    addAlternative(back, arguments);
    back.add_flag("--dry-run", arguments.edit.dryRun, "Say what would be done, and do nothing");

    CLI::App& rename = edit("rename-alternative", "Give an alternative another name", renameAlternative);
    rename.add_option("N", arguments.index, "The alternative's number")
        ->option_text(" ")
        ->required()
        ->check(indexRange());
    rename.add_option("NAME", arguments.name, "Its new name")->option_text(" ")->required();
    CommandLine::addEditOptions(rename, arguments.edit);
}

void declareProject(CommandLine& commandLine)
{
    static ProjectArguments arguments;
    CLI::App& verb = commandLine.addVerb("project", "Show what a project package holds; back up and restore it", [&] {
        return runOn(arguments.package, commandLine.output(),
                     [&] { printProject(arguments.package, *openProject(arguments.package), commandLine.output()); });
    });
    addPackage(verb, arguments);
    declareReading(commandLine, verb, arguments);
    declareEdits(commandLine, verb, arguments);
}

const VerbRegistration registration{65, declareProject};

} // namespace
