// A window on the bytes of an open file: the headers of an audio file are read through it, so that those which lie
// together cost one system call, however often they are asked for.
#pragma once

#include "files/CFileIO.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>

/// Keeps two pieces of the file: its start, and what was read last elsewhere, which is where the chunks behind the
/// samples stand. Does not own the file; what is written to it meanwhile is not seen.
class FileWindow {
public:
    /// `length` is that of the file, asked for once.
    FileWindow(CFileIO& file, std::int64_t length) : file_(file), length_(length) {}

    std::int64_t length() const { return length_; }
    /// Of the first read that did not get what it wanted for another reason than the file's end; kStatusOK until then.
    /// A file whose bytes cannot be read has not ended.
    std::int32_t failure() const { return failure_; }

    /// Copies at most `count` bytes, at most those of a piece, and returns their number: fewer at the file's end, and
    /// on a failure.
    std::size_t readSome(void* to, std::int64_t position, std::size_t count)
    {
        status_ = kStatusEndOfFile;
        if (position < 0 || position >= length_)
            return 0;
        const auto wanted =
            static_cast<std::size_t>(std::min<std::int64_t>(static_cast<std::int64_t>(count), length_ - position));
        const bool isAtStart = position + static_cast<std::int64_t>(wanted) <= std::int64_t{kStartSize};
        const std::size_t copied = isAtStart ? start_.copy(*this, to, position, wanted, 0)
                                             : elsewhere_.copy(*this, to, position, wanted, position);
        if (copied < wanted && status_ != kStatusEndOfFile && failure_ == kStatusOK)
            failure_ = status_;
        return copied;
    }

    /// All of the bytes; kStatusEndOfFile when they are not all there, or are more than a piece; else the status of the
    /// read that failed.
    std::int32_t read(void* to, std::int64_t position, std::size_t count)
    {
        return readSome(to, position, count) == count ? std::int32_t{kStatusOK} : status_;
    }

    /// Copies what may be longer than a piece; the number of bytes that were there.
    std::size_t readPieces(std::byte* to, std::int64_t position, std::size_t count)
    {
        std::size_t done = 0;
        for (std::size_t got = 1; done < count && got > 0; done += got)
            got = readSome(to + done, position + static_cast<std::int64_t>(done), std::min(count - done, kNextSize));
        return done;
    }

private:
    static constexpr std::size_t kStartSize = 4096; // most headers end within it, also those padded to a page
    static constexpr std::size_t kNextSize = 2048;  // a chunk or two behind the samples

    template <std::size_t Capacity>
    struct Piece {
        /// Reads anew from `from` on when the bytes are not all here.
        std::size_t copy(FileWindow& window, void* to, std::int64_t position, std::size_t wanted, std::int64_t from)
        {
            if (position < start || position - start > std::int64_t{Capacity} ||
                static_cast<std::size_t>(position - start) + wanted > size)
                load(window, from);
            const auto offset = static_cast<std::size_t>(position - start);
            const std::size_t copied = offset < size ? std::min(wanted, size - offset) : 0;
            std::memcpy(to, bytes.data() + offset, copied);
            return copied;
        }
        void load(FileWindow& window, std::int64_t from)
        {
            long actual = 0;
            const auto there = std::min<std::int64_t>(std::int64_t{Capacity}, window.length_ - from);
            const std::int32_t status = window.file_.Read(bytes.data(), from, static_cast<long>(there), &actual);
            if (status != kStatusOK)
                window.status_ = status;
            start = from;
            size = static_cast<std::size_t>(std::max(actual, 0L));
        }

        std::int64_t start = 0;
        std::size_t size = 0;
        std::array<std::byte, Capacity> bytes; // filled up to size
    };

    CFileIO& file_;
    std::int64_t length_;
    std::int32_t status_ = kStatusOK;  // of the last read
    std::int32_t failure_ = kStatusOK; // the first that lasted
    Piece<kStartSize> start_;
    Piece<kNextSize> elsewhere_;
};
