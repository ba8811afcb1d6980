// Exchanges an alternative's data with a backup's, and settles an exchange that was cut short.
#include "platform/Log.h"
#include "platform/SmallFile.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"
#include "project/ProjectErrors.h"
#include "project/ProjectExchange.h"
#include "project/ProjectLayout.h"

using platform::Error;
namespace ErrorDomain = platform::ErrorDomain;
using platform::URLRef;

namespace {

constexpr int kMissingDataCode = 1;
constexpr std::size_t kLargestRecord = 1 << 20;

/// An alternative's folder and the record of an exchange in it, if there is one.
struct Alternative {
    std::string package, folder;
    bool hasRecord = false;
    std::optional<ExchangeRecord> record; // none if it is not understood

    std::string backups() const { return folder + '/' + ProjectLayout::backups; }
    std::string recordedBackup() const
    {
        return record->backup.starts_with('/') ? record->backup : backups() + '/' + record->backup;
    }
};

/// None, with `error`, if the package has no such alternative.
std::optional<Alternative> alternativeOf(const URLRef& bundleURL, long index, Error* error)
{
    auto folder = ProjectInformation::pathForVariant(index, bundleURL, AcceptMissing::no);
    if (!folder) {
        platform::fail(error, ErrorDomain::status, kStatusFileNotFound,
                       "there is no alternative " + std::to_string(index));
        return std::nullopt;
    }
    Alternative alternative{.package = pathOf(bundleURL), .folder = std::move(*folder), .record = {}};
    const std::string path = ExchangeRecord::pathIn(alternative.folder);
    platform::FileStatus status;
    alternative.hasRecord = platform::systemCalls().linkStatus(path.c_str(), &status);
    if (alternative.hasRecord)
        if (const auto bytes = platform::readSmallFile(path.c_str(), kLargestRecord))
            alternative.record = ExchangeRecord::fromBytes(*bytes);
    return alternative;
}

/// The path of a backup's folder as it is spelt, because ".." after a link is for the system to resolve. Empty if there
/// is none.
std::string folderPath(const URLRef& url)
{
    std::string path = pathOf(url);
    while (path.size() > 1 && path.ends_with('/'))
        path.pop_back();
    return path;
}

/// The name by which a record refers to a backup: the folder's name if it is one of the alternative's, however it is
/// spelt.
std::string nameInRecord(const Alternative& alternative, const std::string& backup)
{
    const std::string name = backup.substr(backup.rfind('/') + 1);
    const bool isName = !name.empty() && name != "." && name != "..";
    return isName && isSameItem(backup, alternative.backups() + '/' + name) ? name : backup;
}

/// Refuses a backup that is a link or is reached through one inside the package: packages come from anywhere, and a
/// link could name any folder.
bool requireNoLink(const Alternative& alternative, const std::string& name, Error* error)
{
    platform::FileStatus status;
    const bool isLink = name.starts_with('/') ? platform::systemCalls().linkStatus(name.c_str(), &status) &&
                                                    status.kind == platform::FileKind::symbolicLink
                                              : hasLinkBelow(alternative.package, alternative.backups() + '/' + name);
    return !isLink || platform::fail(error, ErrorDomain::status, kStatusAccessDenied,
                                     "backup \"" + name + "\" is a link to somewhere else, or lies behind one");
}

bool failOfUnreadableRecord(const Alternative& alternative, Error* error)
{
    return platform::fail(error, ErrorDomain::status, kStatusFileBusy,
                          ExchangeRecord::pathIn(alternative.folder) +
                              " cannot be read; it tells of an exchange that was cut short");
}

/// Completes or undoes the exchange that the record describes; `backup` is the folder that it means.
bool settle(const Alternative& alternative, const std::string& backup, bool completes, Error* error)
{
    const ExchangeRecord& record = *alternative.record;
    if (!requireNoLink(alternative, nameInRecord(alternative, backup), error))
        return false;
    ProjectExchange exchange(alternative.folder, backup);
    platform::logLine(alternative.folder + ": an exchange with backup \"" + record.backup + "\" was cut short; " +
                      (completes ? "completing it" : "undoing it"));
    return completes ? exchange.complete(record, error) : exchange.undo(record, error);
}

} // namespace

std::optional<InterruptedProjectExchange> ProjectInformation::interruptedExchangeForBundleURL(const URLRef& bundleURL,
                                                                                              long variantIndex)
{
    const auto alternative = alternativeOf(bundleURL, variantIndex, nullptr);
    if (!alternative || !alternative->hasRecord)
        return std::nullopt;
    if (!alternative->record)
        return InterruptedProjectExchange{};
    const std::string backup = alternative->recordedBackup();
    return InterruptedProjectExchange{
        platform::URL::createWithFileSystemPath(platform::String::fromUTF8(backup), platform::PathStyle::posix, true),
        ProjectExchange(alternative->folder, backup).isComplete(*alternative->record)};
}

bool ProjectInformation::exchangeDataOfProjectAtURL(const URLRef& bundleURL, long variantIndex, const URLRef& backupURL,
                                                    Error* error)
{
    const auto alternative = alternativeOf(bundleURL, variantIndex, error);
    if (!alternative)
        return false;
    const std::string backup = folderPath(backupURL);
    const std::string name = nameInRecord(*alternative, backup);
    if (alternative->hasRecord && !alternative->record)
        return failOfUnreadableRecord(*alternative, error);
    if (alternative->record) {
        const std::string recorded = alternative->recordedBackup();
        const bool isSame = alternative->record->backup == name || isSameItem(recorded, backup);
        // An exchange that was completed is not undone, since the user may have worked on: only its record is removed.
        const bool isComplete =
            ProjectExchange(alternative->folder, isSame ? backup : recorded).isComplete(*alternative->record);
        if (!isSame && !isComplete && recorded == alternative->record->backup)
            return platform::fail(error, ErrorDomain::status, kStatusFileBusy,
                                  "an exchange with \"" + recorded +
                                      "\" was cut short; an exchange with it completes that one");
        if (!settle(*alternative, isSame ? backup : recorded, isSame || isComplete, error))
            return false;
        if (isSame)
            return true;
    }
    if (backup.empty() || !itemExists(backup + '/' + ProjectLayout::projectData))
        return platform::fail(error, kProjectErrorDomain, kMissingDataCode,
                              "This backup is missing data and cannot not be restored."); // Kept: the wording
    return requireNoLink(*alternative, name, error) && ProjectExchange(alternative->folder, backup).run(name, error);
}

bool ProjectInformation::settleInterruptedExchangeForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                               SettleExchange how, const URLRef& backupURL,
                                                               Error* error)
{
    const auto alternative = alternativeOf(bundleURL, variantIndex, error);
    if (!alternative)
        return false;
    if (!alternative->hasRecord)
        return platform::fail(error, ErrorDomain::status, kStatusFileNotFound, "no exchange was cut short");
    if (how == SettleExchange::forget) {
        const std::string record = ExchangeRecord::pathIn(alternative->folder);
        return platform::systemCalls().removeFile(record.c_str()) == 0 || failWithSystemError(error, record);
    }
    if (!alternative->record)
        return failOfUnreadableRecord(*alternative, error);
    const std::string recorded = alternative->recordedBackup();
    const std::string given = folderPath(backupURL);
    const bool isPath = recorded == alternative->record->backup;
    if (given.empty() ? isPath : !isSameItem(given, recorded))
        return platform::fail(error, ErrorDomain::status, kStatusFileBusy,
                              "the exchange that was cut short is one with \"" + alternative->record->backup +
                                  "\", which has to be named");
    return settle(*alternative, given.empty() ? recorded : given, how == SettleExchange::complete, error);
}
