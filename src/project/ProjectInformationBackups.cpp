// Backups of alternatives: listing, naming, purging.
#include "platform/Folders.h"
#include "platform/SystemCalls.h"
#include "project/ProjectLayout.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>

using platform::URLRef;

namespace {

/// The prefix of a backup that is being deleted. It hides the folder, so that a half-deleted backup does not pass for
/// one.
constexpr const char* kDeletedPrefix = ".deleted-";
constexpr int kMostLeftovers = 100;

/// Whether a new backup may take the name: it is unused, or that of an empty folder.
bool isFree(const std::string& path)
{
    platform::FileStatus status;
    if (!platform::systemCalls().linkStatus(path.c_str(), &status))
        return true;
    const auto names = status.kind == platform::FileKind::directory ? platform::namesInFolder(path) : std::nullopt;
    return names && names->empty();
}

/// Hides the backup first, then removes it.
bool deleteBackup(const std::string& path)
{
    const std::size_t name = path.rfind('/') + 1;
    const std::string doomed = path.substr(0, name) + kDeletedPrefix + path.substr(name);
    for (int number = 0; number < kMostLeftovers; ++number) {
        const std::string hidden = number == 0 ? doomed : doomed + '-' + std::to_string(number);
        platform::FileStatus status;
        if (platform::systemCalls().linkStatus(hidden.c_str(), &status) && !platform::removeTree(hidden))
            continue; // a leftover of a process that was killed, or somebody else's
        return platform::systemCalls().renameWithoutReplacing(path.c_str(), hidden.c_str()) == 0 &&
               platform::removeTree(hidden);
    }
    return false;
}

/// Chooses which backups of an alternative may be deleted, in the order of the list.
class Purge {
public:
    Purge(const URLRef& bundleURL, long variantIndex)
        : backups_(ProjectInformation::backupsForBundleURL(bundleURL, variantIndex)),
          interrupted_(ProjectInformation::interruptedExchangeForBundleURL(bundleURL, variantIndex))
    {
    }

    const std::vector<ProjectBackup>& backups() const { return backups_; }
    /// Whether the backup takes part in an exchange that was cut short and so holds data of the alternative. If the
    /// record does not say which backup that is, any may be.
    bool isTaken(const std::string& path) const
    {
        return interrupted_ && (!interrupted_->backupURL || isSameItem(path, pathOf(interrupted_->backupURL)) ||
                                path == pathOf(interrupted_->backupURL));
    }
    /// The oldest that may go, as many as are over the limit. `kept` is never among them.
    std::vector<std::string> doomed(std::size_t count, const std::string& kept = "") const
    {
        std::vector<std::string> paths;
        for (const ProjectBackup& backup : backups_)
            if (const std::string& path = pathOf(backup.url);
                paths.size() < count && !isTaken(path) && (kept.empty() || !isSameItem(path, kept)))
                paths.push_back(path);
        return paths;
    }
    /// Moves the backup that was changed last to the end: a backup or an exchange put the user's newest work there,
    /// however old the data in it is.
    void putLastChangedLast()
    {
        const auto changed = [](const ProjectBackup& backup) {
            const auto date = platform::modificationDate(pathOf(backup.url));
            return date ? date->secondsSince2001 : 0;
        };
        const auto last = std::max_element(backups_.begin(), backups_.end(),
                                           [&](const auto& a, const auto& b) { return changed(a) < changed(b); });
        if (last != backups_.end())
            std::rotate(last, std::next(last), backups_.end());
    }

private:
    std::vector<ProjectBackup> backups_;
    std::optional<InterruptedProjectExchange> interrupted_;
};

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
        // A link to a folder is no backup: its target belongs to somebody else.
        platform::FileStatus status;
        if (path.empty() || !platform::systemCalls().linkStatus(path.c_str(), &status) ||
            status.kind != platform::FileKind::directory)
            continue;
        if (const auto date = platform::modificationDate(path + '/' + ProjectLayout::projectData))
            backups.push_back({url, *date});
    }
    std::stable_sort(backups.begin(), backups.end(), [](const ProjectBackup& a, const ProjectBackup& b) {
        return a.date.secondsSince2001 < b.date.secondsSince2001; // the names are sorted already
    });
    return backups;
}

URLRef ProjectInformation::urlForNewBackupForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                       CreateDirectories create, int maxBackups,
                                                       PurgeOldBackups purgeOldBackups)
{
    const URLRef base = backupsBaseURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    if (pathOf(base).empty() || maxBackups <= 0 || hasLinkBelow(pathOf(bundleURL), pathOf(base)))
        return nullptr;
    const Purge purge(bundleURL, variantIndex);
    const auto most = static_cast<std::size_t>(maxBackups);
    const std::size_t there = purge.backups().size();
    const std::size_t tooMany = there < most ? 0 : there - most + 1;
    if (tooMany > 0 && purgeOldBackups == PurgeOldBackups::no)
        return nullptr;
    const std::vector<std::string> doomed = purge.doomed(tooMany);
    if (doomed.size() < tooMany)
        return nullptr;
    // The name is chosen first: without one nothing is deleted.
    for (std::size_t tried = 0; tried < most; ++tried) {
        char name[16];
        const std::size_t number = (there - tooMany + tried) % most; // wraps around to 00
        std::snprintf(name, sizeof name, "%02u", static_cast<unsigned>(number));
        const std::string path = pathOf(itemIn(base, name, true));
        const bool isDoomed = std::find(doomed.begin(), doomed.end(), path) != doomed.end();
        if (!isDoomed && (purge.isTaken(path) || !isFree(path)))
            continue;
        return std::all_of(doomed.begin(), doomed.end(), deleteBackup) ? folderIn(base, name, create) : nullptr;
    }
    return nullptr;
}

bool ProjectInformation::purgeBackupsForBundleURL(const URLRef& bundleURL, long variantIndex, int maxBackups,
                                                  const URLRef& kept)
{
    const URLRef base = backupsBaseURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    if (pathOf(base).empty() || maxBackups <= 0 || hasLinkBelow(pathOf(bundleURL), pathOf(base))) {
        errno = pathOf(base).empty() || maxBackups <= 0 ? EINVAL : ELOOP;
        return false;
    }
    Purge purge(bundleURL, variantIndex);
    purge.putLastChangedLast();
    const auto most = static_cast<std::size_t>(maxBackups);
    const std::size_t there = purge.backups().size();
    const std::vector<std::string> doomed = purge.doomed(there > most ? there - most : 0, pathOf(kept));
    return std::all_of(doomed.begin(), doomed.end(), deleteBackup);
}
