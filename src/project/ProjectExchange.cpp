#include "project/ProjectExchange.h"

#include "platform/SystemCalls.h"
#include "project/ProjectErrors.h"
#include "project/ProjectInformation.h"

#include <algorithm>
#include <cerrno>

using platform::Error;

namespace {

/// The name that an item takes temporarily on a file system that cannot exchange two names in one step.
constexpr const char* kStagedExtension = ".dummy";
constexpr int kConflictCode = 2;

/// Gets the inode number at the path, 0 if nothing is there; false, with errno, if it cannot be determined.
bool itemAt(const std::string& path, std::uint64_t& inode)
{
    platform::FileStatus status;
    errno = 0;
    if (platform::systemCalls().linkStatus(path.c_str(), &status))
        inode = status.inode;
    else if (errno == ENOENT)
        inode = 0;
    else
        return false;
    return true;
}

bool rename(const std::string& from, const std::string& to)
{
    return platform::systemCalls().renameWithoutReplacing(from.c_str(), to.c_str()) == 0;
}

} // namespace

ProjectExchange::ProjectExchange(std::string alternativeFolder, std::string backupFolder)
    : alternativeFolder_(std::move(alternativeFolder)),
      backupFolder_(std::move(backupFolder))
{
}

ProjectExchange::Places ProjectExchange::placesOf(const std::string& name) const
{
    const std::string alternative = alternativeFolder_ + '/' + name;
    return {alternative, backupFolder_ + '/' + name, alternative + kStagedExtension};
}

bool ProjectExchange::look(const Places& places, Found& found)
{
    return itemAt(places.alternative, found.alternative) && itemAt(places.backup, found.backup) &&
           itemAt(places.staged, found.staged);
}

/// Whether the items on disk differ from those in the record.
bool ProjectExchange::isConflict(const ExchangeItem& item, const Found& found)
{
    std::array<std::uint64_t, 3> recorded{item.inAlternative, item.inBackup, 0};
    std::array<std::uint64_t, 3> there{found.alternative, found.backup, found.staged};
    std::sort(recorded.begin(), recorded.end());
    std::sort(there.begin(), there.end());
    return recorded != there;
}

/// The record comes first, whole and flushed with its folder, so that no name moves without it; then the items move,
/// one rename at a time (step); both folders are flushed; the record goes last. A process that dies while the record is
/// there leaves each item in one of the places that the record allows for, and nothing is ever replaced or deleted, so
/// a later call completes or undoes the exchange (settle).
bool ProjectExchange::run(const std::string& backupInRecord, Error* error)
{
    ExchangeRecord record{backupInRecord, {}};
    for (const char* name : kExchangedNames) {
        const Places places = placesOf(name);
        Found found;
        if (!look(places, found))
            return failWithSystemError(error);
        if (found.staged != 0) { // it may be all that is left of a user's data
            errno = EEXIST;
            return failWithSystemError(error, places.staged);
        }
        record.items.push_back({name, found.alternative, found.backup});
    }
    if (!record.write(alternativeFolder_))
        return failWithSystemError(error);

    if (move(record, Side::there) && sync() && forget())
        return true;
    const int reason = errno;
    const bool undone = move(record, Side::back) && sync() && forget();
    errno = reason;
    return failWithSystemError(error, undone ? "" : "the exchange was cut short; the next one completes or undoes it");
}

bool ProjectExchange::settle(const ExchangeRecord& record, Side side, Error* error)
{
    for (const ExchangeItem& item : record.items) {
        Found found;
        if (!look(placesOf(item.name), found))
            return failWithSystemError(error);
        if (isConflict(item, found)) {
            forget();
            return platform::fail(error, kProjectErrorDomain, kConflictCode,
                                  "an exchange with backup \"" + record.backup + "\" was cut short, and \"" +
                                      item.name + "\" has been replaced since; all data stays where it is");
        }
    }
    return (move(record, side) && sync() && forget()) || failWithSystemError(error);
}

bool ProjectExchange::isComplete(const ExchangeRecord& record) const
{
    return std::all_of(record.items.begin(), record.items.end(), [this](const ExchangeItem& item) {
        Found found;
        return look(placesOf(item.name), found) && found.alternative == item.inBackup &&
               found.backup == item.inAlternative;
    });
}

bool ProjectExchange::move(const ExchangeRecord& record, Side side) const
{
    if (side == Side::there)
        return std::all_of(record.items.begin(), record.items.end(),
                           [&](const ExchangeItem& item) { return moveItem(item, side); });
    return std::all_of(record.items.rbegin(), record.items.rend(),
                       [&](const ExchangeItem& item) { return moveItem(item, side); });
}

bool ProjectExchange::moveItem(const ExchangeItem& item, Side side) const
{
    const Places places = placesOf(item.name);
    const bool there = side == Side::there;
    constexpr int kMostSteps = 4; // aside, over, back; and one to see that all is well
    for (int steps = 0; steps <= kMostSteps; ++steps) {
        Found found;
        if (!look(places, found))
            return false;
        if (isConflict(item, found)) {
            errno = EBUSY; // another process replaced it meanwhile
            return false;
        }
        if (found.alternative == (there ? item.inBackup : item.inAlternative) &&
            found.backup == (there ? item.inAlternative : item.inBackup))
            return true;
        if (!step(item, side, places, found))
            return false;
    }
    errno = EBUSY;
    return false;
}

/// Renames once, towards the side. Items are told apart by inode number, which renaming keeps, so what stands where
/// always says how far the exchange got. On a file system that cannot exchange two names, an exchange takes three
/// renames; A and B are the items that began in the alternative and in the backup:
///
///   alternative  staged  backup
///   A            -       B       the record is on disk, nothing has moved
///   -            A       B       1. the alternative's item steps aside
///   B            A       -       2. the backup's item takes its place
///   B            -       A       3. the first item takes the place in the backup
///
/// From each line one more rename leads on, or back towards the first line. A process that dies anywhere leaves one of
/// these lines and the record, by which the next exchange of the alternative, or a command to settle, completes or
/// undoes the rest.
bool ProjectExchange::step(const ExchangeItem& item, Side side, const Places& places, const Found& found) const
{
    if (found.staged != 0) {
        const bool belongsToAlternative = found.staged == (side == Side::there ? item.inBackup : item.inAlternative);
        if (belongsToAlternative)
            return found.alternative != 0 ? rename(places.alternative, places.backup)
                                          : rename(places.staged, places.alternative);
        return found.backup != 0 ? rename(places.backup, places.alternative) : rename(places.staged, places.backup);
    }
    if (found.backup == 0)
        return rename(places.alternative, places.backup);
    if (found.alternative == 0)
        return rename(places.backup, places.alternative);
    if (platform::systemCalls().exchangeNames(places.alternative.c_str(), places.backup.c_str()) == 0)
        return true;
    const bool isUnknown = errno == EINVAL || errno == ENOSYS || errno == ENOTSUP;
    return isUnknown && rename(places.alternative, places.staged);
}

/// Commits the new places to disk before the record is removed, so that no power failure leaves an exchange without its
/// record.
bool ProjectExchange::sync() const
{
    const platform::SystemCalls& calls = platform::systemCalls();
    return calls.syncFolder(alternativeFolder_.c_str()) == 0 && calls.syncFolder(backupFolder_.c_str()) == 0;
}

bool ProjectExchange::forget()
{
    const platform::SystemCalls& calls = platform::systemCalls();
    if (calls.removeFile(ExchangeRecord::pathIn(alternativeFolder_).c_str()) != 0)
        return false;
    calls.syncFolder(alternativeFolder_.c_str()); // settling once more what is settled does no harm
    return true;
}
