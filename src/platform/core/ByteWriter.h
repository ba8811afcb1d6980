// The one writer for byte layouts with variable tails.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"
#include "platform/core/Packed.h"

#include <bit>

/// Appends fields one after the other to bytes that it owns until `take()`.
class ByteWriter {
public:
    explicit ByteWriter(std::endian order = std::endian::big) : order_(order) {}

    template <class T>
        requires std::is_arithmetic_v<T>
    void write(T value)
    {
        const std::size_t at = bytes_.size();
        bytes_.resize(at + sizeof value);
        store(bytes_.data() + at, value, order_);
    }

    void writeFourCC(FourCC code)
    {
        const std::size_t at = bytes_.size();
        bytes_.resize(at + 4);
        storeBE(bytes_.data() + at, code);
    }

    void write(BytesView bytes) { bytes_.insert(bytes_.end(), bytes.begin(), bytes.end()); }
    void writeZeros(std::size_t count) { bytes_.resize(bytes_.size() + count); }
    void reserve(std::size_t count) { bytes_.reserve(count); }

    /// Overwrites a field written earlier: a size that is known only at the end.
    template <class T>
    void patch(std::size_t position, T value)
    {
        store(bytes_.data() + position, value, order_);
    }

    std::size_t size() const { return bytes_.size(); }
    BytesView view() const { return bytes_; }
    Bytes take() { return std::move(bytes_); }

private:
    Bytes bytes_;
    std::endian order_;
};
