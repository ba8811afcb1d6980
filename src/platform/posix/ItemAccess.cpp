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
    // The look comes first: who is about to take his turn must not find it taken for the moment of a look.
    if (someoneWaits() || !tryLock(number(), turn, LockKind::exclusive)) {
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

/// Those who are present now. Whoever has come meanwhile is found by the look that follows with data in hand.
void ItemAccess::askInQueue()
{
    const std::vector<int> present = presentSlots(true);
    if (present.empty())
        return;
    dropTicket(kWriterTickets); // the asking byte is ours: readers behind us look again, and pass
    spent_.clear();
    Questions questions(*directory_, spent_);
    const std::vector<int> unreachable = ask(questions, present, true, true);
    questions.wait();
    agreed_.insert(agreed_.end(), questions.agreed().begin(), questions.agreed().end());
    awaitAbsence(unreachable, true);
}

/// Without the queue, an agreement counts only when it was given while the data byte was ours: nobody can come to hold
/// the item for longer meanwhile. Whoever takes longer to answer is awaited with nothing in hand, and then asked again.
void ItemAccess::acquireAskingUnderData(LockKind kind, bool isWriter)
{
    for (;;) {
        takeData(kind);
        agreed_.clear();
        spent_.clear();
        std::vector<int> unreachable;
        Questions questions(*directory_, spent_);
        for (std::vector<int> present = presentSlots(isWriter); unreachable.empty(); present = presentSlots(isWriter)) {
            if (present.empty())
                return;
            unreachable = ask(questions, present, isWriter, false);
            if (!questions.waitFor(kMoment))
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
    if (!someoneIsThere(kCommonPresence, kReaderPresence + kSlotCount))
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
    if (!someoneIsThere(kWriterPresence, kReaderTickets + kTicketCount))
        return isAcquired_ = true;
    unlock(number(), both);
    return false;
}

/// Looked up anew each time, with the queue or data in hand: another presenter here may have come to hold the item
/// meanwhile.
std::optional<std::int64_t> ItemAccess::ownPresence() const
{
    if (own_ == nullptr)
        return std::nullopt;
    return PresenterRegistry::shared().presenceOfOnly(own_, key_, *directory_);
}

/// Whether an exclusive lock of others lies from one offset up to another, our own presence apart.
bool ItemAccess::someoneIsThere(std::int64_t from, std::int64_t to)
{
    const auto own = ownPresence();
    if (!own || *own < from || *own >= to)
        return findExclusiveLock(number(), window_.range(from, to - from)).has_value();
    return (from < *own && findExclusiveLock(number(), window_.range(from, *own - from))) ||
           (*own + 1 < to && findExclusiveLock(number(), window_.range(*own + 1, to - *own - 1)));
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

/// One past the last ticket that is taken. Each query costs the kernel a walk over all who wait, so it is found by
/// leaps that double, then halve, not one by one.
std::int64_t ItemAccess::nextTicket(std::int64_t tickets)
{
    std::int64_t next = 0, end = kTicketCount, leap = 0; // taken below `next` alone, free from `end` on
    while (next < end) {
        const std::int64_t from = std::min(next + leap, end - 1);
        if (const auto taken = findExclusiveLock(number(), window_.range(tickets + from, end - from))) {
            next = window_.offsetOf(taken->end()) - tickets;
            leap = std::max(2 * leap, std::int64_t{1});
        } else {
            end = from;
            leap = (end - next) / 2;
        }
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
    std::vector<std::int64_t> present;
    findPresent(isWriter ? kWriterPresence : kCommonPresence, kWriterTickets, present);
    if (!isWriter)
        findPresent(kReaderPresence, kReaderPresence + kSlotCount, present);
    if (present.empty())
        return {};
    const auto own = ownPresence();
    std::vector<int> slots;
    for (const std::int64_t offset : present) {
        static_assert(kWriterPresence % kSlotCount == 0 && kReaderPresence % kSlotCount == 0);
        const int slot = static_cast<int>(offset % kSlotCount);
        if (offset != own && std::find(agreed_.begin(), agreed_.end(), slot) == agreed_.end())
            slots.push_back(slot);
    }
    std::sort(slots.begin(), slots.end());
    slots.erase(std::unique(slots.begin(), slots.end()), slots.end()); // of the two kinds that a process may have
    return slots;
}

/// The presence bytes from one offset up to another. A query gives any lock of its range, so the rest is left on both
/// sides of it.
void ItemAccess::findPresent(std::int64_t from, std::int64_t to, std::vector<std::int64_t>& present)
{
    if (from >= to)
        return;
    const auto taken = findExclusiveLock(number(), window_.range(from, to - from));
    if (!taken)
        return;
    const std::int64_t begin = std::max(window_.offsetOf(taken->start), from);
    const std::int64_t end = std::min(window_.offsetOf(taken->end()), to);
    for (std::int64_t offset = begin; offset < end; ++offset)
        present.push_back(offset);
    findPresent(from, begin, present);
    findPresent(end, to, present);
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

/// Who has just ended, or cannot be reached, is absent when its presence bytes fall.
void ItemAccess::awaitAbsence(const std::vector<int>& slots, bool ofWriters)
{
    for (const int slot : slots)
        for (const AskedBy askedBy : {ofWriters ? AskedBy::writers : AskedBy::readers, AskedBy::both}) {
            const ByteRange byte = window_.range(presenceOffset(askedBy) + slot);
            waitForLock(number(), byte, LockKind::shared);
            unlock(number(), byte);
        }
}

} // namespace platform
