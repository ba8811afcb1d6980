// The bytes of a stripe file that stand for an item, and the meaning of each.
#pragma once

#include "platform/FileCoordination.h"
#include "platform/posix/RangeLock.h"

#include <cstdint>

namespace platform {

inline constexpr int kStripeCount = 256;
/// Processes that can present at the same time.
inline constexpr int kSlotCount = 1 << 16;
inline constexpr std::int64_t kTicketCount = 1 << 22;

/// Offsets in a window, in ascending order. The bytes that a writer looks for (presenters to writers, waiters) are
/// adjacent, and so are those that a reader looks for, so that one query finds each. A presenter to both has a single
/// byte.
enum WindowOffset : std::int64_t {
    kDataByte = 0,              // exclusive: a writer has access; shared: readers have
    kQueueByte = 1,             // exclusive: a writer has its turn, and access or asks for it
    kAskingByte = 2,            // exclusive: that writer asks presenters, and readers need not wait for those behind it
    kParkedByte = 3,            // shared: waits for presenters, and holds nothing else; for listings only
    kWriterPresence = 0x0F0000, // exclusive, one per slot: that process must be asked by writers
    kCommonPresence = 0x100000, // by writers and readers
    kWriterTickets = 0x110000,  // exclusive, one each: a writer waits; numbered in one sequence with …
    kReaderTickets = 0x510000,  // … these: waits for the data byte alone
    kReaderPresence = 0x910000, // by readers
    kWindowSize = 0x1000000,
};
static_assert(kWriterPresence + kSlotCount == kCommonPresence && kCommonPresence + kSlotCount == kWriterTickets);
static_assert(kWriterTickets + kTicketCount == kReaderTickets);
static_assert(kReaderTickets + kTicketCount == kReaderPresence && kReaderPresence + kSlotCount < kWindowSize);

/// Offset of the presence bytes of presenters that these ask; add the slot's number.
inline std::int64_t presenceOffset(AskedBy askedBy)
{
    return askedBy == AskedBy::both ? kCommonPresence : askedBy == AskedBy::writers ? kWriterPresence : kReaderPresence;
}

/// Eight bits of the key select the stripe and 38 the window in it. Items that share all 46 merely wait for each other.
struct ItemWindow {
    int stripe;
    std::int64_t base;

    explicit ItemWindow(const SHA256Digest& key) : stripe(std::to_integer<int>(key[0])), base(0)
    {
        for (int i = 1; i <= 5; ++i)
            base = base << 8 | std::to_integer<std::int64_t>(key[static_cast<std::size_t>(i)]);
        base = (base >> 2) * kWindowSize;
    }

    ByteRange range(std::int64_t offset, std::int64_t length = 1) const { return {base + offset, length}; }
    ByteRange whole() const { return range(0, kWindowSize); }
    /// The offset in the window of an absolute offset of the stripe.
    std::int64_t offsetOf(std::int64_t position) const { return position - base; }
};

} // namespace platform
