// The one bounded reader for byte layouts with variable tails.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"
#include "platform/core/Packed.h"

#include <bit>

/// Reads fields one after the other from bytes that it does not own. A read past the end yields zero (or an empty
/// view), moves to the end and makes ok() false for good, so that a parser can read a whole record and test once.
class ByteReader {
public:
    /// `order` is the byte order of every number that is read.
    explicit ByteReader(BytesView bytes, std::endian order = std::endian::big) : bytes_(bytes), order_(order) {}

    /// The next number of `sizeof(T)` bytes, integer or floating point.
    template <class T>
    T read()
    {
        const BytesView field = take(sizeof(T));
        return field.empty() ? T{} : load<T>(field.data(), order_);
    }

    /// The next four characters, in file order whatever the byte order of the numbers.
    FourCC readFourCC()
    {
        const BytesView field = take(4);
        return field.empty() ? 0 : loadBE<FourCC>(field.data());
    }

    /// A view of the next `count` bytes; empty when fewer are left.
    BytesView take(std::size_t count)
    {
        if (count > remaining()) {
            position_ = bytes_.size();
            ok_ = false;
            return {};
        }
        const BytesView taken = bytes_.subspan(position_, count);
        position_ += count;
        return taken;
    }

    /// Passes over `count` bytes; more than are left is an error, as in take().
    void skip(std::size_t count) { take(count); }
    /// A view of the bytes that are left; the position stays.
    BytesView rest() const { return bytes_.subspan(position_); }
    /// In bytes from the start.
    std::size_t position() const { return position_; }
    /// How many bytes are left.
    std::size_t remaining() const { return bytes_.size() - position_; }
    /// False once a read went past the end.
    bool ok() const { return ok_; }

private:
    BytesView bytes_;
    std::size_t position_ = 0;
    std::endian order_;
    bool ok_ = true;
};
