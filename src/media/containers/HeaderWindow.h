// A window on the bytes of an open file: headers, and small chunks beside them, are read through it, so that those
// which lie together cost one call however often they are read.
#pragma once

#include "media/containers/ByteSource.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <cstring>

namespace platform {

/// Keeps two pieces of the file: its start, and what was last read elsewhere, which is where the chunks after the
/// samples lie. Does not own the file, and does not see later writes to it.
class HeaderWindow {
public:
    /// The most bytes that at() gives.
    static constexpr std::size_t kMostAtOnce = 2048;

    /// `length` is that of the file, in bytes.
    HeaderWindow(const ByteSource& file, std::uint64_t length) : file_(file), length_(length) {}

    /// Stops reading: from now on, bytes that are not held fail.
    void seal() { isSealed_ = true; }

    /// In bytes, as given.
    std::uint64_t length() const { return length_; }
    /// The status of the first read that failed, else kStatusOK. It tells a file that cannot be read from one that
    /// ends.
    std::int32_t failure() const { return failure_; }
    /// Why at() last gave nothing, or read() not all: kStatusEndOfFile, or the status of the read that failed.
    std::int32_t reason() const { return reason_; }

    /// `count` bytes at `position`, valid until the next call. Null when the file ends ahead of them, and when they
    /// cannot be read.
    const std::byte* at(std::uint64_t position, std::size_t count)
    {
        reason_ = kStatusEndOfFile;
        if (position > length_ || count > length_ - position)
            return nullptr;
        const bool isAtStart = position + count <= kStartSize;
        return isAtStart ? start_.at(*this, 0, position, count) : elsewhere_.at(*this, position, position, count);
    }

    /// The same, but only of bytes that were read already; null for others.
    const std::byte* held(std::uint64_t position, std::size_t count) const
    {
        const std::byte* found = start_.find(position, count);
        return found != nullptr ? found : elsewhere_.find(position, count);
    }

    /// Copies as many of the bytes as there are, and returns their number: fewer at the end of the file and on
    /// failure.
    std::size_t readSome(void* to, std::uint64_t position, std::size_t count)
    {
        reason_ = kStatusEndOfFile;
        if (position >= length_)
            return 0;
        const auto there = static_cast<std::size_t>(std::min<std::uint64_t>(count, length_ - position));
        std::size_t done = 0;
        for (std::size_t step = 0; done < there; done += step) {
            const std::byte* bytes = at(position + done, step = std::min(there - done, kMostAtOnce));
            if (bytes == nullptr)
                break;
            std::copy_n(bytes, step, static_cast<std::byte*>(to) + done);
        }
        return done;
    }

    /// Copies all of the bytes. kStatusEndOfFile when they are not all there, else the status of the failed read.
    std::int32_t read(void* to, std::uint64_t position, std::size_t count)
    {
        return readSome(to, position, count) == count ? std::int32_t{kStatusOK} : reason_;
    }
    /// Copies a record; false, and the record untouched, when it cannot be read: reason() says why.
    template <class Record>
    bool get(Record& record, std::uint64_t position)
    {
        const std::byte* bytes = at(position, sizeof record);
        if (bytes != nullptr)
            std::memcpy(&record, bytes, sizeof record);
        return bytes != nullptr;
    }

private:
    static constexpr std::size_t kStartSize = 4096; // most headers end within it, also those padded to a page

    template <std::size_t Capacity>
    struct Piece {
        const std::byte* find(std::uint64_t position, std::size_t count) const
        {
            if (position < start || position - start > size || count > size - (position - start))
                return nullptr;
            return bytes.data() + (position - start);
        }
        /// Reads anew from `from` on when they are not all here.
        const std::byte* at(HeaderWindow& window, std::uint64_t from, std::uint64_t position, std::size_t count)
        {
            if (const std::byte* found = find(position, count)) [[likely]]
                return found;
            window.load(bytes.data(), from, Capacity, size);
            start = from;
            return find(position, count);
        }

        std::uint64_t start = 0;
        std::size_t size = 0;
        std::array<std::byte, Capacity> bytes; // filled up to size
    };

    void load(std::byte* to, std::uint64_t from, std::size_t capacity, std::size_t& got)
    {
        const auto count = static_cast<std::size_t>(std::min<std::uint64_t>(capacity, length_ - from));
        got = 0;
        const std::int32_t status = isSealed_ ? std::int32_t{kStatusIOError} : file_.readSome(from, to, count, got);
        if (status == kStatusOK)
            return;
        reason_ = status;
        if (failure_ == kStatusOK)
            failure_ = status;
    }

    const ByteSource& file_;
    std::uint64_t length_;
    bool isSealed_ = false;
    std::int32_t reason_ = kStatusEndOfFile;
    std::int32_t failure_ = kStatusOK;
    Piece<kStartSize> start_;
    Piece<kMostAtOnce> elsewhere_;
};

} // namespace platform
