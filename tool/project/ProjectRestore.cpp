#include "tool/project/ProjectRestore.h"

#include "platform/core/JsonWriter.h"
#include "tool/project/ProjectEdit.h"
#include "tool/project/ProjectPackage.h"
#include "tool/project/ProjectReport.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <filesystem>
#include <system_error>

namespace {

constexpr const char* kUnreadable =
    "an exchange with a backup was cut short, and its record cannot be read: project settle --forget drops it";

bool isSameFolder(const platform::URL& a, const platform::URL& b)
{
    std::error_code error;
    return std::filesystem::equivalent(a.posixPath(), b.posixPath(), error);
}

platform::URLRef backupNamed(const ProjectInformation& project, long alternative, const std::string& name)
{
    const auto base =
        ProjectInformation::backupsBaseURLForBundleURL(project.projectURL(), alternative, CreateDirectories::no);
    const bool isName = !name.starts_with('.') && name.find('/') == name.npos;
    if (base)
        requireNoLink(project.projectURL()->posixPath(), base->posixPath());
    auto url = base && isName ? base->appendingPathComponent(platform::String::fromUTF8(name), true) : nullptr;
    if (!url || !std::filesystem::is_directory(url->posixPath()))
        throw Failure(fmt::format("alternative {} has no backup \"{}\"", alternative, name));
    requireNoLink(project.projectURL()->posixPath(), url->posixPath());
    return url;
}

/// What a restore does first with an exchange that was cut short.
const char* outcomeText(bool completes, bool wasComplete, bool isDryRun)
{
    if (completes)
        return isDryRun ? "would complete it" : "completed it";
    if (wasComplete)
        return isDryRun ? "would leave it so" : "left it so";
    return isDryRun ? "would undo it" : "undid it";
}

} // namespace

void restoreBackup(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, arguments.wait, [&](const std::string& package) {
        const auto project = openProject(package);
        const long alternative = alternativeOf(*project, arguments.alternative);
        const platform::URLRef backup = backupNamed(*project, alternative, arguments.backup);
        const auto interrupted =
            ProjectInformation::interruptedExchangeForBundleURL(project->projectURL(), alternative);
        if (interrupted && !interrupted->backupURL)
            throw Failure(kUnreadable);
        const bool completes = interrupted && isSameFolder(*interrupted->backupURL, *backup);
        const bool wasComplete = interrupted && !completes && interrupted->isComplete;
        platform::Error error;
        if (!arguments.edit.dryRun &&
            !ProjectInformation::exchangeDataOfProjectAtURL(project->projectURL(), alternative, backup, &error))
            throw Failure(error.description);
        std::string sentence;
        if (interrupted)
            sentence =
                fmt::format("found an exchange with backup {} that was cut short{}; {}; ",
                            backupName(*interrupted, *project, alternative), wasComplete ? " when all was done" : "",
                            outcomeText(completes, wasComplete, arguments.edit.dryRun));
        sentence += fmt::format("alternative {} {} the data of backup {}, which {} what the alternative had",
                                alternative, arguments.edit.dryRun ? "would have" : "has", backupName(backup),
                                arguments.edit.dryRun ? "would have" : "has");
        const auto members = [&](JsonWriter& json) {
            json.member("alternative", alternative).member("backup", backupName(backup));
            json.member("dryRun", arguments.edit.dryRun);
            if (interrupted)
                json.member("interruptedExchange", backupName(*interrupted, *project, alternative));
        };
        printProjectEdit(arguments.package, output, members, printable(sentence));
    });
}

void settleExchange(const ProjectArguments& arguments, const OutputOptions& output)
{
    editProject(arguments.package, arguments.wait, [&](const std::string& package) {
        const auto project = openProject(package);
        const long alternative = alternativeOf(*project, arguments.alternative);
        const auto interrupted =
            ProjectInformation::interruptedExchangeForBundleURL(project->projectURL(), alternative);
        if (!interrupted)
            throw Failure(fmt::format("no exchange of alternative {} was cut short", alternative));
        if (!interrupted->backupURL && !arguments.forget)
            throw Failure(kUnreadable);
        const std::string backup = backupName(*interrupted, *project, alternative);
        if (backup.starts_with('/') && arguments.backup.empty() && !arguments.forget)
            throw Failure("the exchange that was cut short is one with " + printable(backup) +
                          "; --with says that this folder is meant");
        const SettleExchange how = arguments.forget ? SettleExchange::forget
                                   : arguments.undo ? SettleExchange::undo
                                                    : SettleExchange::complete;
        const auto with = arguments.backup.empty() ? platform::URLRef() : projectFolder(arguments.backup).URL();
        platform::Error error;
        if (!arguments.edit.dryRun && !ProjectInformation::settleInterruptedExchangeForBundleURL(
                                          project->projectURL(), alternative, how, with, &error))
            throw Failure(error.description);
        const char* const done = arguments.forget ? "forgotten" : arguments.undo ? "undone" : "completed";
        const auto members = [&](JsonWriter& json) {
            json.member("alternative", alternative).member("settled", done).member("dryRun", arguments.edit.dryRun);
            if (!backup.empty())
                json.member("backup", backup);
        };
        printProjectEdit(arguments.package, output, members,
                         fmt::format("the exchange of alternative {} with {} {} {}", alternative,
                                     backup.empty() ? "an unknown backup" : "backup " + printable(backup),
                                     arguments.edit.dryRun ? "would be" : "is", done));
    });
}
