// A source of bytes that is read once, from front to back.
#pragma once

#include "platform/core/Bytes.h"

#include <algorithm>
#include <cstddef>
#include <span>
#include <utility>

namespace platform {

/// A source of bytes. Derived classes own or borrow what they read.
class InputStream {
public:
    InputStream() = default;
    InputStream(const InputStream&) = delete;
    InputStream& operator=(const InputStream&) = delete;
    virtual ~InputStream() = default;

    /// Fills the front of `buffer` and returns how many bytes it put there: at least one, or 0 at the end of the
    /// source. A negative number is a status code (core/Status.h) and ends the source.
    virtual std::ptrdiff_t read(std::span<std::byte> buffer) = 0;
};

/// A stream over bytes in memory, which must outlive it.
class BorrowedInputStream : public InputStream {
public:
    /// Reads `bytes` from the front.
    explicit BorrowedInputStream(BytesView bytes) : left_(bytes) {}

    std::ptrdiff_t read(std::span<std::byte> buffer) override
    {
        const BytesView piece = left_.first(std::min(buffer.size(), left_.size()));
        std::copy(piece.begin(), piece.end(), buffer.begin());
        left_ = left_.subspan(piece.size());
        return static_cast<std::ptrdiff_t>(piece.size());
    }

private:
    BytesView left_;
};

/// A stream over bytes in memory, which it owns.
class MemoryInputStream : public InputStream {
public:
    /// Reads `bytes` from the front.
    explicit MemoryInputStream(Bytes bytes) : bytes_(std::move(bytes)), stream_(bytes_) {}
    std::ptrdiff_t read(std::span<std::byte> buffer) override { return stream_.read(buffer); }

private:
    const Bytes bytes_;
    BorrowedInputStream stream_;
};

} // namespace platform
