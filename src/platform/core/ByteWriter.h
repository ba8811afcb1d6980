// The one writer for byte layouts with variable tails.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"
#include "platform/core/Packed.h"

#include <bit>

/// Appends fields one after the other to bytes that it owns until `take()`.
class ByteWriter {
public:
    /// `order` is the byte order of every number that is written.
    explicit ByteWriter(std::endian order = std::endian::big) : order_(order) {}

    /// Appends a number of `sizeof(T)` bytes.
    template <class T>
        requires std::is_arithmetic_v<T>
    void write(T value)
    {
        const std::size_t at = bytes_.size();
        bytes_.resize(at + sizeof value);
        store(bytes_.data() + at, value, order_);
    }

    /// Appends four characters, in file order whatever the byte order of the numbers.
    void writeFourCC(FourCC code)
    {
        const std::size_t at = bytes_.size();
        bytes_.resize(at + 4);
        storeBE(bytes_.data() + at, code);
    }

    /// Appends bytes as they are.
    void write(BytesView bytes) { bytes_.insert(bytes_.end(), bytes.begin(), bytes.end()); }
    /// Appends `count` zero bytes.
    void writeZeros(std::size_t count) { bytes_.resize(bytes_.size() + count); }
    /// Takes memory for `count` bytes in all, so that appending does not.
    void reserve(std::size_t count) { bytes_.reserve(count); }

    /// Overwrites a field written earlier, such as a size that is known only at the end. The field must lie within
    /// size().
    template <class T>
    void patch(std::size_t position, T value)
    {
        store(bytes_.data() + position, value, order_);
    }

    /// How many bytes are written.
    std::size_t size() const { return bytes_.size(); }
    /// The bytes so far; valid until the next write.
    BytesView view() const { return bytes_; }
    /// Hands the bytes over; the writer is empty then.
    Bytes take() { return std::move(bytes_); }

private:
    Bytes bytes_;
    std::endian order_;
};
