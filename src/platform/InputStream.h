// A source of bytes that is read once, from front to back.
#pragma once

#include "platform/core/Bytes.h"

#include <algorithm>
#include <cstddef>
#include <span>
#include <utility>

namespace platform {

class InputStream {
public:
    InputStream() = default;
    InputStream(const InputStream&) = delete;
    InputStream& operator=(const InputStream&) = delete;
    virtual ~InputStream() = default;

    /// Fills the front of `buffer` and returns how many bytes it put there: at least one, or 0 at the end of the
    /// source. A negative number is a status code (core/Status.h), and the end as well.
    virtual std::ptrdiff_t read(std::span<std::byte> buffer) = 0;
};

/// Bytes that lie in memory, which the stream owns.
class MemoryInputStream : public InputStream {
public:
    explicit MemoryInputStream(Bytes bytes) : bytes_(std::move(bytes)) {}

    std::ptrdiff_t read(std::span<std::byte> buffer) override
    {
        const std::size_t count = std::min(buffer.size(), bytes_.size() - at_);
        std::copy_n(bytes_.begin() + static_cast<std::ptrdiff_t>(at_), count, buffer.begin());
        at_ += count;
        return static_cast<std::ptrdiff_t>(count);
    }

private:
    Bytes bytes_;
    std::size_t at_ = 0;
};

} // namespace platform
