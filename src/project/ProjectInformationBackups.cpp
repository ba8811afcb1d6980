// Backups of alternatives: listed, named, purged, exchanged with what they are backups of.
#include "platform/Folders.h"
#include "platform/Log.h"
#include "platform/SmallFile.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"
#include "project/ProjectErrors.h"
#include "project/ProjectExchange.h"
#include "project/ProjectLayout.h"
#include "project/ProjectLists.h"
#include "project/ProjectMediaPaths.h"

#include <algorithm>
#include <cstdio>

using platform::Error;
using platform::URLRef;

namespace {

constexpr int kMissingDataCode = 1;
constexpr std::size_t kLargestRecord = 1 << 20;
/// A backup that is being deleted: hidden, so that one of which half is left is none any more.
constexpr const char* kDeletedPrefix = ".deleted-";

std::string lastComponent(const std::string& path)
{
    return path.substr(path.rfind('/') + 1);
}

/// Whether a new backup may have the name: nothing has it, or a folder in which nothing is.
bool isFree(const std::string& path)
{
    platform::FileStatus status;
    if (!platform::systemCalls().linkStatus(path.c_str(), &status))
        return true;
    const auto names = status.kind == platform::FileKind::directory ? platform::namesInFolder(path) : std::nullopt;
    return names && names->empty();
}

bool deleteBackup(const std::string& path)
{
    const std::string doomed = path.substr(0, path.rfind('/') + 1) + kDeletedPrefix + lastComponent(path);
    platform::FileStatus status;
    if (platform::systemCalls().linkStatus(doomed.c_str(), &status) && !platform::removeTree(doomed))
        return false; // left by one that was killed
    return platform::systemCalls().renameWithoutReplacing(path.c_str(), doomed.c_str()) == 0 &&
           platform::removeTree(doomed);
}

/// The record of an exchange in the alternative's folder. `isThere` tells one that is not understood from none.
std::optional<ExchangeRecord> recordIn(const std::string& alternative, bool& isThere)
{
    platform::FileStatus status;
    const std::string path = ExchangeRecord::pathIn(alternative);
    isThere = platform::systemCalls().linkStatus(path.c_str(), &status);
    if (!isThere)
        return std::nullopt;
    const auto bytes = platform::readSmallFile(path.c_str(), kLargestRecord);
    return bytes ? ExchangeRecord::fromBytes(*bytes) : std::nullopt;
}

std::string backupsFolder(const std::string& alternative)
{
    return alternative + '/' + ProjectLayout::backups;
}

/// What a record calls a backup's folder.
std::string nameInRecord(const std::string& alternative, const std::string& backup)
{
    const std::string name = lastComponent(backup);
    return backup == standardizedPath(backupsFolder(alternative)) + '/' + name ? name : backup;
}

std::string pathFromRecord(const std::string& alternative, const std::string& name)
{
    return name.starts_with('/') ? name : backupsFolder(alternative) + '/' + name;
}

/// Completes the exchange that was cut short when it was with the backup that is meant now, else undoes it. A path from
/// a record is not followed: a package could name any folder.
bool settleInterrupted(const ExchangeRecord& record, const std::string& alternative, bool isSame, Error* error)
{
    if (!isSame && record.backup.starts_with('/'))
        return platform::fail(error, platform::ErrorDomain::status, kStatusFileBusy,
                              "an exchange with \"" + record.backup +
                                  "\" was cut short; an exchange with it completes that one");
    platform::logLine(alternative + ": an exchange with backup \"" + record.backup + "\" was cut short; " +
                      (isSame ? "completing it" : "undoing it"));
    ProjectExchange exchange(alternative, pathFromRecord(alternative, record.backup));
    return isSame ? exchange.complete(record, error) : exchange.undo(record, error);
}

} // namespace

std::vector<ProjectBackup> ProjectInformation::backupsForBundleURL(const URLRef& bundleURL, long variantIndex)
{
    std::vector<ProjectBackup> backups;
    const URLRef base = backupsBaseURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    const auto names = pathOf(base).empty() ? std::nullopt : platform::namesInFolder(pathOf(base));
    if (!names)
        return backups;
    for (const std::string& name : *names) {
        if (name.starts_with('.'))
            continue;
        const URLRef url = itemIn(base, name.c_str(), true); // null for a name that is no text
        const std::string& path = pathOf(url);
        if (!folderExists(path))
            continue;
        if (const auto date = platform::modificationDate(path + '/' + ProjectLayout::projectData))
            backups.push_back({url, *date});
    }
    std::stable_sort(backups.begin(), backups.end(), [](const ProjectBackup& a, const ProjectBackup& b) {
        return a.date.secondsSince2001 < b.date.secondsSince2001; // the names are in order already
    });
    return backups;
}

URLRef ProjectInformation::urlForNewBackupForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                       CreateDirectories create, int maxBackups,
                                                       PurgeOldBackups purgeOldBackups)
{
    const URLRef base = backupsBaseURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    if (pathOf(base).empty() || maxBackups <= 0)
        return nullptr;
    std::vector<ProjectBackup> backups = backupsForBundleURL(bundleURL, variantIndex);
    // One that takes part in an exchange that was cut short holds data of the alternative.
    const auto interrupted = interruptedExchangeForBundleURL(bundleURL, variantIndex);
    const std::string taken = interrupted ? pathOf(interrupted->backupURL) : "";

    const auto most = static_cast<std::size_t>(maxBackups);
    std::size_t count = backups.size();
    if (purgeOldBackups == PurgeOldBackups::yes) {
        for (const ProjectBackup& backup : backups) {
            if (count < most)
                break;
            if (pathOf(backup.url) == taken)
                continue;
            if (!deleteBackup(pathOf(backup.url)))
                return nullptr;
            --count;
        }
    }
    if (count >= most)
        return nullptr;
    for (std::size_t tried = 0; tried < most; ++tried) {
        char name[16];
        std::snprintf(name, sizeof name, "%02u", static_cast<unsigned>((count + tried) % most)); // round to 00 and up
        const URLRef url = itemIn(base, name, true);
        if (pathOf(url) != taken && isFree(pathOf(url)))
            return folderIn(base, name, create);
    }
    return nullptr;
}

std::optional<InterruptedProjectExchange> ProjectInformation::interruptedExchangeForBundleURL(const URLRef& bundleURL,
                                                                                              long variantIndex)
{
    const auto alternative = pathForVariant(variantIndex, bundleURL, AcceptMissing::no);
    bool isThere = false;
    const auto record = alternative ? recordIn(*alternative, isThere) : std::nullopt;
    if (!record)
        return std::nullopt;
    const std::string backup = pathFromRecord(*alternative, record->backup);
    return InterruptedProjectExchange{
        platform::URL::createWithFileSystemPath(platform::String::fromUTF8(backup), platform::PathStyle::posix, true),
        ProjectExchange(*alternative, backup).isComplete(*record)};
}

bool ProjectInformation::exchangeDataOfProjectAtURL(const URLRef& bundleURL, long variantIndex, const URLRef& backupURL,
                                                    Error* error)
{
    const auto alternative = pathForVariant(variantIndex, bundleURL, AcceptMissing::no);
    if (!alternative)
        return platform::fail(error, platform::ErrorDomain::status, kStatusFileNotFound,
                              "there is no alternative " + std::to_string(variantIndex));
    const std::string backup = pathOf(backupURL).empty() ? "" : standardizedPath(pathOf(backupURL));
    const std::string name = nameInRecord(*alternative, backup);

    bool isThere = false;
    if (const auto record = recordIn(*alternative, isThere)) {
        const bool isSame = record->backup == name;
        if (!settleInterrupted(*record, *alternative, isSame, error))
            return false;
        if (isSame)
            return true;
    } else if (isThere) {
        return platform::fail(error, platform::ErrorDomain::status, kStatusFileBusy,
                              ExchangeRecord::pathIn(*alternative) + " cannot be read; it tells of an exchange that " +
                                  "was cut short");
    }
    if (backup.empty() || !itemExists(backup + '/' + ProjectLayout::projectData))
        return platform::fail(error, kProjectErrorDomain, kMissingDataCode,
                              "This backup is missing data and cannot not be restored."); // Kept: the wording
    return ProjectExchange(*alternative, backup).run(name, error);
}
