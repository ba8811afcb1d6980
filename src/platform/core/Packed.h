// Integers without alignment, and their loads and stores in a stated byte order. Structs that are file layouts have
// Packed members, so that their size and offsets are those of the file.
#pragma once

#include <array>
#include <bit>
#include <cstdint>
#include <cstring>
#include <type_traits>

/// The bytes of `value` reversed; integers of 1, 2, 4 and 8 bytes.
template <class T>
    requires std::is_integral_v<T> || std::is_enum_v<T>
constexpr T byteSwapped(T value)
{
    if constexpr (sizeof(T) == 1)
        return value;
    else if constexpr (sizeof(T) == 2)
        return static_cast<T>(__builtin_bswap16(static_cast<std::uint16_t>(value)));
    else if constexpr (sizeof(T) == 4)
        return static_cast<T>(__builtin_bswap32(static_cast<std::uint32_t>(value)));
    else
        return static_cast<T>(__builtin_bswap64(static_cast<std::uint64_t>(value)));
}

/// `value`, turned from host order to `order`, or back.
template <class T>
constexpr T inByteOrder(T value, std::endian order)
{
    return order == std::endian::native ? value : byteSwapped(value);
}

/// An integer or float from unaligned memory in the given byte order.
template <class T>
T load(const void* from, std::endian order)
{
    if constexpr (std::is_floating_point_v<T>) {
        using Bits = std::conditional_t<sizeof(T) == 4, std::uint32_t, std::uint64_t>;
        return std::bit_cast<T>(load<Bits>(from, order));
    } else {
        T value;
        std::memcpy(&value, from, sizeof value);
        return inByteOrder(value, order);
    }
}

/// An integer or float from unaligned memory, big-endian.
template <class T>
T loadBE(const void* from)
{
    return load<T>(from, std::endian::big);
}

/// An integer or float from unaligned memory, little-endian.
template <class T>
T loadLE(const void* from)
{
    return load<T>(from, std::endian::little);
}

/// Writes an integer or float to unaligned memory in the given byte order.
template <class T>
void store(void* to, T value, std::endian order)
{
    if constexpr (std::is_floating_point_v<T>) {
        using Bits = std::conditional_t<sizeof(T) == 4, std::uint32_t, std::uint64_t>;
        store(to, std::bit_cast<Bits>(value), order);
    } else {
        const T ordered = inByteOrder(value, order);
        std::memcpy(to, &ordered, sizeof ordered);
    }
}

/// Writes an integer or float to unaligned memory, big-endian.
template <class T>
void storeBE(void* to, T value)
{
    store(to, value, std::endian::big);
}

/// Writes an integer or float to unaligned memory, little-endian.
template <class T>
void storeLE(void* to, T value)
{
    store(to, value, std::endian::little);
}

/// A `T` of alignment 1. It stays in the byte order in which it was read until `turnFields` (ByteOrder.h) turns it.
template <class T>
class Packed {
public:
    constexpr Packed() = default;
    /// Holds `value` in host order.
    constexpr Packed(T value) : bytes_(std::bit_cast<Storage>(value)) {}
    /// The value, taken to be in host order.
    constexpr operator T() const { return std::bit_cast<T>(bytes_); }
    constexpr Packed& operator=(T value)
    {
        bytes_ = std::bit_cast<Storage>(value);
        return *this;
    }

private:
    using Storage = std::array<unsigned char, sizeof(T)>;
    Storage bytes_{};
};
static_assert(alignof(Packed<std::uint64_t>) == 1 && sizeof(Packed<std::uint64_t>) == 8);
