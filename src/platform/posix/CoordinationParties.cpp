// Lists who holds or awaits what. The kernel shows the locks of each descriptor of a process; the byte says what a lock
// means.
#include "platform/FileCoordination.h"

#include "platform/posix/CoordinationDirectory.h"
#include "platform/posix/ItemWindow.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>
#include <system_error>
#include <tuple>

namespace platform {

namespace {

namespace fs = std::filesystem;

struct HeldLock {
    std::int64_t start;
    bool isExclusive;
};

/// Parses lines like "lock:        1: OFDLCK ADVISORY  WRITE -1 fe:01:1234 17 17".
std::vector<HeldLock> locksOf(const fs::path& descriptorInformation)
{
    std::vector<HeldLock> locks;
    std::ifstream file(descriptorInformation);
    for (std::string line; std::getline(file, line);) {
        std::istringstream words(line);
        std::string label, number, kind, advisory, access, owner, inode;
        HeldLock lock{};
        if (words >> label >> number >> kind >> advisory >> access >> owner >> inode >> lock.start &&
            label == "lock:" && kind == "OFDLCK") {
            lock.isExclusive = access == "WRITE";
            locks.push_back(lock);
        }
    }
    return locks;
}

/// The stripe that a descriptor's link leads to, or -1.
int stripeOf(const std::string& target, const std::string& prefix)
{
    int stripe = -1;
    if (target.starts_with(prefix))
        std::from_chars(target.data() + prefix.size(), target.data() + target.size(), stripe);
    return stripe >= 0 && stripe < kStripeCount ? stripe : -1;
}

/// Interprets the locks of one descriptor. A lock on the data byte is access. Any other except a presence is a wait: a
/// ticket, the queue byte of a writer that asks, or the mark of a parked reader.
void addParties(int process, int stripe, const std::vector<HeldLock>& locks, std::vector<CoordinationParty>& parties)
{
    using Role = CoordinationParty::Role;
    const auto hasLock = [&](std::int64_t window, std::int64_t from, std::int64_t to) {
        return std::any_of(locks.begin(), locks.end(), [&](const HeldLock& lock) {
            return lock.start >= window * kWindowSize + from && lock.start < window * kWindowSize + to;
        });
    };
    for (const HeldLock& lock : locks) {
        const std::int64_t window = lock.start / kWindowSize, offset = lock.start % kWindowSize;
        const bool isOfWriters = offset >= kWriterPresence && offset < kWriterTickets;
        const bool isOfReaders = offset >= kReaderPresence || (isOfWriters && offset >= kCommonPresence);
        const std::uint64_t item = static_cast<std::uint64_t>(stripe) << 38 | static_cast<std::uint64_t>(window);
        if (offset == kDataByte)
            parties.push_back({process, Role::holds, lock.isExclusive, item});
        else if (isOfWriters || isOfReaders) {
            for (const bool byWriters : {false, true})
                // A shared lock waits for the byte to fall.
                if (lock.isExclusive && (byWriters ? isOfWriters : isOfReaders))
                    parties.push_back({process, Role::presents, byWriters, item});
        } else if (!hasLock(window, kDataByte, kDataByte + 1))
            parties.push_back(
                {process, Role::waits,
                 hasLock(window, kQueueByte, kQueueByte + 1) || hasLock(window, kWriterTickets, kReaderTickets), item});
    }
}

std::vector<CoordinationParty> partiesIn(const std::vector<std::shared_ptr<CoordinationDirectory>>& folders)
{
    std::vector<CoordinationParty> parties;
    std::vector<std::string> prefixes;
    for (const auto& folder : folders)
        prefixes.push_back(folder->path() + "/" + CoordinationDirectory::stripeName(0).substr(0, 7));
    std::error_code ignored; // processes may end meanwhile, and those of others show nothing
    for (const auto& process : fs::directory_iterator("/proc", ignored)) {
        const std::string name = process.path().filename();
        int id = 0;
        if (std::from_chars(name.data(), name.data() + name.size(), id).ptr != name.data() + name.size())
            continue;
        std::error_code notOurs;
        for (fs::directory_iterator one(process.path() / "fd", notOurs), end; !notOurs && one != end;
             one.increment(notOurs)) {
            std::error_code closed;
            const std::string target = fs::read_symlink(one->path(), closed);
            for (const std::string& prefix : prefixes)
                if (const int stripe = stripeOf(target, prefix); stripe >= 0)
                    addParties(id, stripe, locksOf(process.path() / "fdinfo" / one->path().filename()), parties);
        }
    }
    const auto order = [](const CoordinationParty& a) {
        return std::tuple(a.itemNumber, a.processID, a.role, a.isWriting);
    };
    std::sort(parties.begin(), parties.end(), [&](const auto& a, const auto& b) { return order(a) < order(b); });
    parties.erase(std::unique(parties.begin(), parties.end()), parties.end());
    return parties;
}

} // namespace

std::uint64_t coordinationItemNumber(const CoordinatedItem& item)
{
    const ItemWindow window(item.key());
    return static_cast<std::uint64_t>(window.stripe) << 38 | static_cast<std::uint64_t>(window.base / kWindowSize);
}

std::vector<CoordinationParty> coordinationParties(Error* error)
{
    try {
        return partiesIn(CoordinationDirectory::all());
    } catch (const std::system_error& failure) {
        fail(error, ErrorDomain::system, failure.code().value(), failure.what());
        return {};
    }
}

std::vector<CoordinationParty> coordinationParties(const CoordinatedItem& item, Error* error)
{
    std::vector<CoordinationParty> parties = coordinationParties(error);
    std::erase_if(parties, [number = coordinationItemNumber(item)](const CoordinationParty& party) {
        return party.itemNumber != number;
    });
    return parties;
}

} // namespace platform
