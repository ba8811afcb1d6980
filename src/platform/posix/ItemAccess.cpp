#include "platform/posix/ItemAccess.h"

#include "platform/posix/PresenterRegistry.h"

#include <algorithm>
#include <system_error>

namespace platform {

namespace {

/// For how long an answer is awaited with the data byte in hand.
constexpr std::chrono::milliseconds kMoment{2};

} // namespace

ItemAccess::ItemAccess(std::shared_ptr<CoordinationDirectory> directory, const SHA256Digest& key,
                       const FilePresenter* own)
    : directory_(std::move(directory)),
      key_(key),
      window_(key),
      own_(own),
      stripe_(directory_->takeStripe(window_.stripe))
{
}

ItemAccess::~ItemAccess()
{
    if (!isAcquired_)
        return;
    try {
        unlock(number(), window_.whole());
        directory_->putStripe(window_.stripe, std::move(stripe_));
    } catch (const std::exception&) {
        // Closing the descriptor gives the locks back.
    }
}

void ItemAccess::acquireForReading()
{
    if (tryToAcquireForReading())
        return;
    acquireAskingUnderData(LockKind::shared, false);
    isAcquired_ = true;
}

void ItemAccess::acquireForWriting(bool mayGoFirst)
{
    if (tryToAcquireForWriting())
        return;
    if (mayGoFirst && own_ != nullptr && PresenterRegistry::shared().owesQueue(own_))
        acquireAskingUnderData(LockKind::exclusive, true);
    else
        acquireInQueue();
    isAcquired_ = true;
}

/// Nobody comes to hold the item for longer while the queue is ours, save by answering us later: what was agreed stays
/// so, and readers pass meanwhile.
void ItemAccess::acquireInQueue()
{
    const ByteRange turn = window_.range(kQueueByte, 2);
    static_assert(kAskingByte == kQueueByte + 1);
    bool isHad = tryLock(number(), turn, LockKind::exclusive);
    if (isHad && someoneWaits()) {
        unlock(number(), turn);
        isHad = false;
    }
    if (!isHad) {
        takeTicket(kWriterTickets);
        awaitTickets({kWriterTickets, kReaderTickets});
        waitForLock(number(), turn, LockKind::exclusive);
    }
    for (;;) {
        askInQueue();
        if (!lockNow(kDataByte, LockKind::exclusive)) {
            if (!ticket_)
                takeTicket(kWriterTickets); // holds back those who come now
            unlockByte(kAskingByte);
            waitForLock(number(), window_.range(kDataByte), LockKind::exclusive);
        } else {
            unlockByte(kAskingByte);
        }
        dropTicket(kWriterTickets);
        if (presentSlots(true).empty())
            return;
        lockNow(kAskingByte, LockKind::exclusive);
        unlockByte(kDataByte);
    }
}

void ItemAccess::askInQueue()
{
    for (std::vector<int> present = presentSlots(true); !present.empty(); present = presentSlots(true)) {
        dropTicket(kWriterTickets); // the asking byte is ours: readers behind us look again, and pass
        Questions questions(*directory_);
        const std::vector<int> unreachable = ask(questions, present, true, true);
        questions.wait();
        agreed_.insert(agreed_.end(), questions.agreed().begin(), questions.agreed().end());
        awaitAbsence(unreachable, true);
    }
}

/// Without the queue, an agreement counts only when it was given while the data byte was ours: nobody can come to hold
/// the item for longer meanwhile. Whoever takes longer to answer is awaited with nothing in hand, and then asked again.
void ItemAccess::acquireAskingUnderData(LockKind kind, bool isWriter)
{
    for (;;) {
        takeData(kind);
        agreed_.clear();
        std::vector<int> unreachable;
        Questions questions(*directory_);
        for (std::vector<int> present = presentSlots(isWriter); unreachable.empty(); present = presentSlots(isWriter)) {
            if (present.empty())
                return;
            unreachable = ask(questions, present, isWriter, false);
            if (!questions.wait(kMoment))
                break;
            agreed_ = questions.agreed();
        }
        unlockByte(kDataByte);
        lockNow(kParkedByte, LockKind::shared);
        questions.wait();
        awaitAbsence(unreachable, isWriter);
        unlockByte(kParkedByte);
    }
}

/// Data, and nobody who waits or presents.
bool ItemAccess::tryToAcquireForReading()
{
    if (!lockNow(kDataByte, LockKind::shared))
        return false;
    if (!someoneIsThere(kWriterTickets, kReaderPresence + kSlotCount, false))
        return isAcquired_ = true;
    unlockByte(kDataByte);
    return false;
}

/// Queue and data in one step, and nobody who waits or presents.
bool ItemAccess::tryToAcquireForWriting()
{
    const ByteRange both = window_.range(kDataByte, 2);
    static_assert(kQueueByte == kDataByte + 1);
    if (!tryLock(number(), both, LockKind::exclusive))
        return false;
    if (!someoneIsThere(kWriterPresence, kReaderTickets + kTicketCount, true))
        return isAcquired_ = true;
    unlock(number(), both);
    return false;
}

/// Looked up anew each time, with the queue or data in hand: another presenter here may have come to hold the item
/// meanwhile.
int ItemAccess::ownSlot(bool isWriter) const
{
    return own_ == nullptr ? -1 : PresenterRegistry::shared().slotOfOnly(own_, key_, isWriter, *directory_);
}

/// Whether an exclusive lock of others lies from one offset up to another, our own presence apart.
bool ItemAccess::someoneIsThere(std::int64_t from, std::int64_t to, bool isWriter)
{
    const int slot = ownSlot(isWriter);
    if (slot < 0)
        return findExclusiveLock(number(), window_.range(from, to - from)).has_value();
    const std::int64_t own = (isWriter ? kWriterPresence : kReaderPresence) + slot;
    return (from < own && findExclusiveLock(number(), window_.range(from, own - from))) ||
           (own + 1 < to && findExclusiveLock(number(), window_.range(own + 1, to - own - 1)));
}

/// The data byte alone, without the queue. First come, first served, save that writers behind one that asks are passed:
/// it may have to wait for long, and for somebody who lets this access through.
void ItemAccess::takeData(LockKind kind)
{
    if (lockNow(kDataByte, kind)) {
        if (!someoneWaits())
            return;
        unlockByte(kDataByte);
    }
    takeTicket(kReaderTickets);
    while (!findExclusiveLock(number(), window_.range(kAskingByte))) {
        const auto ahead = lowestWriterAhead();
        if (!ahead)
            break;
        waitForLock(number(), *ahead, LockKind::shared);
        unlock(number(), *ahead);
    }
    awaitTickets({kReaderTickets});
    waitForLock(number(), window_.range(kDataByte), kind);
    dropTicket(kReaderTickets);
}

bool ItemAccess::someoneWaits()
{
    return findExclusiveLock(number(), window_.range(kWriterTickets, 2 * kTicketCount)).has_value();
}

/// One past the last ticket that is taken.
std::int64_t ItemAccess::nextTicket(std::int64_t tickets)
{
    std::int64_t next = 0;
    while (next < kTicketCount) {
        const auto taken = findExclusiveLock(number(), window_.range(tickets + next, kTicketCount - next));
        if (!taken)
            break;
        next = window_.offsetOf(taken->end()) - tickets;
    }
    return next;
}

/// Takes the number behind the last. When the numbers are used up there is none to take, and it is behind all that have
/// one.
void ItemAccess::takeTicket(std::int64_t tickets)
{
    std::int64_t writers = 0, readers = 0;
    do {
        writers = nextTicket(kWriterTickets);
        readers = nextTicket(kReaderTickets);
        ticket_ = std::min(std::max(writers, readers), kTicketCount);
    } while (*ticket_ < kTicketCount && !lockNow(tickets + *ticket_, LockKind::exclusive));
    if (*ticket_ == kTicketCount)
        lockNow(kParkedByte, LockKind::shared);
}

void ItemAccess::dropTicket(std::int64_t tickets)
{
    if (!ticket_)
        return;
    unlock(number(), window_.range(tickets, kTicketCount));
    if (*ticket_ == kTicketCount)
        unlockByte(kParkedByte);
    ticket_.reset();
}

/// Waits until no number below ours is taken in these ranges. The one just ahead is awaited first, so that each waiter
/// is woken by one; then all, should that one have been killed or passed.
void ItemAccess::awaitTickets(std::initializer_list<std::int64_t> ranges)
{
    if (*ticket_ == 0)
        return;
    for (const std::int64_t tickets : ranges)
        waitForLock(number(), window_.range(tickets + *ticket_ - 1), LockKind::shared);
    for (const std::int64_t tickets : ranges) {
        const ByteRange all = window_.range(tickets, *ticket_);
        waitForLock(number(), all, LockKind::shared);
        unlock(number(), all);
    }
}

std::optional<ByteRange> ItemAccess::lowestWriterAhead()
{
    std::optional<ByteRange> lowest;
    std::int64_t end = std::min(*ticket_ + 1, kTicketCount);
    while (const auto taken =
               end > 0 ? findExclusiveLock(number(), window_.range(kWriterTickets, end)) : std::nullopt) {
        lowest = taken;
        end = window_.offsetOf(taken->start) - kWriterTickets;
    }
    return lowest;
}

/// The slots whose processes have to be asked still: those that agreed are not, nor our own presenter.
std::vector<int> ItemAccess::presentSlots(bool isWriter)
{
    std::vector<int> known = agreed_;
    if (const int own = ownSlot(isWriter); own >= 0)
        known.push_back(own);
    std::sort(known.begin(), known.end());
    std::vector<int> present;
    const std::int64_t first = window_.presence(isWriter).start;
    int next = 0;
    for (const int slot : known) {
        findPresent(first, next, slot, present);
        next = slot + 1;
    }
    findPresent(first, next, kSlotCount, present);
    return present;
}

/// Those from slot `from` up to `to`. A query gives any lock of its range, so the rest is left on both sides of it.
void ItemAccess::findPresent(std::int64_t first, int from, int to, std::vector<int>& present)
{
    if (from >= to)
        return;
    const auto taken = findExclusiveLock(number(), {first + from, to - from});
    if (!taken)
        return;
    const int begin = static_cast<int>(std::max(taken->start - first, std::int64_t{from}));
    const int end = static_cast<int>(std::min(taken->end() - first, std::int64_t{to}));
    for (int slot = begin; slot < end; ++slot)
        present.push_back(slot);
    findPresent(first, from, begin, present);
    findPresent(first, end, to, present);
}

/// Gives back the slots at which nobody listens.
std::vector<int> ItemAccess::ask(Questions& questions, const std::vector<int>& slots, bool isWriter, bool holdsQueue)
{
    Request request;
    request.byWriter = isWriter;
    request.holdsQueue = holdsQueue;
    request.asker = reinterpret_cast<std::uintptr_t>(own_);
    request.askerHome = PresenterRegistry::shared().home();
    request.key = key_;
    std::vector<int> unreachable;
    for (const int slot : slots)
        if (questions.ask(slot, request) == Questions::Asked::nobodyThere)
            unreachable.push_back(slot);
    return unreachable;
}

/// Who has just ended, or cannot be reached, is absent when its presence byte falls.
void ItemAccess::awaitAbsence(const std::vector<int>& slots, bool ofWriters)
{
    for (const int slot : slots) {
        const ByteRange byte = {window_.presence(ofWriters).start + slot, 1};
        waitForLock(number(), byte, LockKind::shared);
        unlock(number(), byte);
    }
}

} // namespace platform
