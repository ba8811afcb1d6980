#include "platform/posix/ItemAccess.h"

#include "platform/posix/PresenterRegistry.h"

#include <algorithm>
#include <system_error>

namespace platform {

namespace {

/// How long answers are awaited with the data byte locked.
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
        // Closing the descriptor releases the locks.
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

/// Takes the writer's turn, then asks every presenter, then takes the data. The order of the locks, all of which the
/// kernel drops if the process dies:
///
/// 1. A ticket (unless nobody waits), until all lower ones are gone. Others queue behind it.
/// 2. Queue and asking byte, in one step. Writers now wait; readers see the asking byte and pass the waiting writers.
/// 3. Questions to the presenters, without the ticket, so that readers that come meanwhile get through.
/// 4. The data byte, for which a ticket holds back new readers again. The asking byte falls, then the ticket.
/// 5. One more look for presenters. If there is a new one, the asking byte is taken again, the data byte is released,
///    and 3 follows; otherwise access begins.
///
/// While the queue is ours, nobody else comes to hold the item for longer, except by answering us later, so an
/// agreement from 3 stays valid until 5. A process that is killed at any step leaves nothing behind: its tickets and
/// bytes fall, the next waiter wakes, and the presenters find the connection closed and forget the question.
void ItemAccess::acquireInQueue()
{
    const ByteRange turn = window_.range(kQueueByte, 2);
    static_assert(kAskingByte == kQueueByte + 1);
    // The look comes first: a writer that is about to take its turn must not find it taken for the moment of a look.
    if (someoneWaits() || !tryLock(number(), turn, LockKind::exclusive)) {
        takeTicket(kWriterTickets);
        awaitTickets({kWriterTickets, kReaderTickets});
        waitForLock(number(), turn, LockKind::exclusive);
    }
    for (;;) {
        askInQueue();
        if (!lockNow(kDataByte, LockKind::exclusive)) {
            if (!ticket_)
                takeTicket(kWriterTickets); // holds back those who come from now on
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

/// Asks those who are present now. Whoever comes meanwhile is found by the look that follows under the data byte.
void ItemAccess::askInQueue()
{
    const std::vector<int> present = presentSlots(true);
    if (present.empty())
        return;
    dropTicket(kWriterTickets); // while the asking byte is ours, readers behind us look again and pass
    spent_.clear();
    Questions questions(*directory_, spent_);
    const std::vector<int> unreachable = ask(questions, present, true, true);
    questions.wait();
    agreed_.insert(agreed_.end(), questions.agreed().begin(), questions.agreed().end());
    awaitAbsence(unreachable, true);
}

/// Without the queue, an agreement counts only if it was given while the data byte was ours, because nobody can acquire
/// a presented lock meanwhile. Answers that take longer are awaited with nothing held, and the presenters are then
/// asked again. A process that dies while parked leaves only the mark for listings, which falls with it.
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

/// Takes the data byte; succeeds if nobody waits or presents.
bool ItemAccess::tryToAcquireForReading()
{
    if (!lockNow(kDataByte, LockKind::shared))
        return false;
    if (!someoneIsThere(kCommonPresence, kReaderPresence + kSlotCount))
        return isAcquired_ = true;
    unlockByte(kDataByte);
    return false;
}

/// Takes queue and data byte in one step; succeeds if nobody waits or presents.
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

/// Looked up each time, with the queue or data byte held: another presenter of this process may have acquired the item
/// meanwhile.
std::optional<std::int64_t> ItemAccess::ownPresence() const
{
    if (own_ == nullptr)
        return std::nullopt;
    return PresenterRegistry::shared().presenceOfOnly(own_, key_, *directory_);
}

/// Whether another description holds an exclusive lock in [from, to), apart from our own presence.
bool ItemAccess::someoneIsThere(std::int64_t from, std::int64_t to)
{
    const auto own = ownPresence();
    if (!own || *own < from || *own >= to)
        return findExclusiveLock(number(), window_.range(from, to - from)).has_value();
    return (from < *own && findExclusiveLock(number(), window_.range(from, *own - from))) ||
           (*own + 1 < to && findExclusiveLock(number(), window_.range(*own + 1, to - *own - 1)));
}

/// Takes the data byte alone, without the queue. First come, first served, except that writers behind one that asks are
/// passed: it may wait for long, and for somebody who lets this access through.
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

/// One past the last ticket taken. Each query makes the kernel walk over all waiters, so the search leaps, doubling and
/// then halving the step.
std::int64_t ItemAccess::nextTicket(std::int64_t tickets)
{
    std::int64_t next = 0, end = kTicketCount, leap = 0; // all from `end` on are free
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

/// Takes the number after the last. When all numbers are used up it takes none and waits for all that have one.
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

/// Waits until no lower number is taken in these ranges: first for the one just ahead, so that each release wakes one
/// waiter, then for all, in case that one was killed or passed.
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

/// The slots that are still to be asked, without those that agreed and our own presenter.
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
    slots.erase(std::unique(slots.begin(), slots.end()), slots.end()); // a process may have presences of two kinds
    return slots;
}

/// Collects the presence bytes in [from, to). A query returns any lock in its range, so both sides of it are searched
/// further.
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

/// Returns the slots where nobody listens.
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

/// Waits until processes that ended or cannot be reached are absent, which their presence bytes show.
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
