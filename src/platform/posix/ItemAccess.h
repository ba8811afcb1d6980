// One coordinated access to one item, from the request to the release.
#pragma once

#include "platform/posix/CoordinationDirectory.h"
#include "platform/posix/ItemWindow.h"
#include "platform/posix/RequestChannel.h"

#include <initializer_list>
#include <memory>
#include <optional>
#include <vector>

namespace platform {

class FilePresenter;

/// All locks belong to one open file description. Dropping it releases them, whatever goes wrong.
class ItemAccess {
public:
    /// `own` is the presenter of the asking coordinator, or null.
    ItemAccess(std::shared_ptr<CoordinationDirectory> directory, const SHA256Digest& key, const FilePresenter* own);
    ~ItemAccess();
    ItemAccess(const ItemAccess&) = delete;
    ItemAccess& operator=(const ItemAccess&) = delete;

    /// These wait for access, and throw std::system_error if the system refuses. `mayGoFirst`: does not wait for the
    /// queue while `own` owes an answer to the writer that holds it.
    void acquireForReading();
    void acquireForWriting(bool mayGoFirst);
    /// These do not wait: false, with nothing held, if somebody else has, presents or awaits the item.
    bool tryToAcquireForReading();
    bool tryToAcquireForWriting();
    /// False if the folder was deleted meanwhile, so that what was acquired excludes nobody.
    bool isSeen() { return directory_->stillThere(stripe_); }

private:
    void acquireInQueue();
    void askInQueue();
    void acquireAskingUnderData(LockKind kind, bool isWriter);
    void takeData(LockKind kind);
    bool someoneWaits();
    std::int64_t nextTicket(std::int64_t tickets);
    void takeTicket(std::int64_t tickets);
    void dropTicket(std::int64_t tickets);
    void awaitTickets(std::initializer_list<std::int64_t> ranges);
    std::optional<ByteRange> lowestWriterAhead();
    std::vector<int> ask(Questions& questions, const std::vector<int>& slots, bool isWriter, bool holdsQueue);
    std::vector<int> presentSlots(bool isWriter);
    void findPresent(std::int64_t from, std::int64_t to, std::vector<std::int64_t>& present);
    void awaitAbsence(const std::vector<int>& slots, bool ofWriters);
    std::optional<std::int64_t> ownPresence() const;
    bool someoneIsThere(std::int64_t from, std::int64_t to);

    bool lockNow(std::int64_t offset, LockKind kind) { return tryLock(number(), window_.range(offset), kind); }
    void unlockByte(std::int64_t offset) { unlock(number(), window_.range(offset)); }
    int number() const { return stripe_.get(); }

    std::shared_ptr<CoordinationDirectory> directory_;
    SHA256Digest key_;
    ItemWindow window_;
    const FilePresenter* own_;
    std::vector<int> agreed_;            // slots
    std::optional<std::int64_t> ticket_; // kTicketCount: behind all that have one
    std::vector<Descriptor> spent_;      // sockets of answered questions, closed when access ends
    Descriptor stripe_;
    bool isAcquired_ = false;
};

} // namespace platform
