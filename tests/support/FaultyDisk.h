// A disk that fails one write of an edit, or all from there on: edits are cut short at each single call.
#pragma once

#include "platform/SystemCalls.h"
#include "support/FaultInjection.h"

#include <cerrno>

enum class Fault {
    none,
    once,
    onceAfterHalf,
    fromThereOn,   // as if the process had been killed
    fullAfterHalf, // everything but a chunk header fails
    full           // existing bytes can be rewritten, and nothing can be added
};

/// Counts the calls that change the file, and makes one of them, or all from there on, fail.
struct FaultyDisk {
    static inline int calls;
    static inline int failing; // number of the failing call
    static inline Fault fault;
    static inline std::int64_t fullSize;
    static inline platform::SystemCalls real;
    SystemCallGuard guard;

    FaultyDisk(int call, Fault kind)
    {
        calls = 0;
        failing = call;
        fault = kind;
        fullSize = -1;
        real = guard.real();
        platform::systemCalls().pwrite = write;
        platform::systemCalls().ftruncate = [](int descriptor, std::int64_t length) {
            return fails() ? -1 : real.ftruncate(descriptor, length);
        };
        platform::systemCalls().fsync = [](int) { return fails() ? -1 : 0; }; // tests cut no power and should be quick
    }

    static bool fails()
    {
        const int call = calls++;
        const bool isOnce = fault == Fault::once || fault == Fault::onceAfterHalf;
        if (fault == Fault::none || fault == Fault::full || call < failing || (isOnce && call > failing))
            return false;
        errno = ENOSPC;
        return true;
    }

    static std::int64_t write(int descriptor, const void* from, std::size_t count, std::int64_t position)
    {
        if (!fails())
            return fault == Fault::full && calls > failing ? writeWhereItIs(descriptor, from, count, position)
                                                           : real.pwrite(descriptor, from, count, position);
        const bool isHeader = fault == Fault::fullAfterHalf && count <= 12; // the disk has room for these bytes already
        if (calls - 1 == failing && !isHeader && (fault == Fault::onceAfterHalf || fault == Fault::fullAfterHalf)) {
            real.pwrite(descriptor, from, count / 2, position);
            if (count >= 2)
                errno = EIO;
        }
        return -1;
    }

    /// On a full disk, bytes beyond the file's end at the time when it became full are lost.
    static std::int64_t writeWhereItIs(int descriptor, const void* from, std::size_t count, std::int64_t position)
    {
        platform::FileStatus status;
        if (fullSize < 0 && real.status(descriptor, &status))
            fullSize = status.size;
        if (position + static_cast<std::int64_t>(count) <= fullSize)
            return real.pwrite(descriptor, from, count, position);
        errno = ENOSPC;
        if (position >= fullSize)
            return -1;
        return real.pwrite(descriptor, from, static_cast<std::size_t>(fullSize - position), position);
    }
};
