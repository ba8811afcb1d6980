// The binary property list, format 1.0: header "bplist00", objects, a table of their offsets, 32-byte trailer.
// Everything in it is big-endian; objects refer to each other by their number in the table.
#pragma once

#include "platform/PropertyList.h"
#include "platform/core/Bytes.h"
#include "platform/core/Packed.h"
#include "platform/core/Value.h"

#include <array>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace platform::plist {

inline constexpr std::string_view kBinaryHeader = "bplist00";

/// The high four bits of an object's first byte. The low bits are the size or count, or 15 if an integer object with
/// the count follows.
/// with the count follows.
enum class BinaryKind : std::uint8_t {
    simple = 0x0,  // low bits: 8 false, 9 true
    integer = 0x1, // 2^n bytes; 1, 2 and 4 bytes are unsigned, 8 and 16 are signed
    real = 0x2,    // 2^n bytes: 4 or 8
    date = 0x3,    // 8 bytes, a real: seconds since 2001-01-01 UTC
    data = 0x4,
    ascii = 0x5,
    utf16 = 0x6,      // the count is one of 16-bit units
    array = 0xA,      // references
    dictionary = 0xD, // references: all keys, then all values
};

/// The last 32 bytes of the file.
struct BinaryTrailer {
    std::array<std::uint8_t, 6> unused{};    //  0
    std::uint8_t offsetSize = 0;             //  6  bytes per entry of the offset table
    std::uint8_t referenceSize = 0;          //  7  bytes per reference to an object
    Packed<std::uint64_t> objectCount;       //  8
    Packed<std::uint64_t> topObject;         // 16
    Packed<std::uint64_t> offsetTableOffset; // 24

    /// Converts from the file's byte order to the host's, or back.
    void byteOrder();
};
static_assert(sizeof(BinaryTrailer) == 32);

/// The limit for the total cost of the unfolded values of a list of `bytes` bytes.
constexpr std::uint64_t unfoldingBudget(std::uint64_t bytes)
{
    return 256 * bytes + 64 * 1024;
}
/// Cost of one value apart from its text and data; in a dictionary it includes a share of the tree.
inline constexpr std::uint64_t kElementCost = sizeof(Value);
inline constexpr std::uint64_t kEntryCost = sizeof(Value) + sizeof(std::string) + 64;

/// Tests eight bytes at a time; the last eight overlap if the size is no multiple of eight.
inline bool isASCII(std::string_view text)
{
    constexpr std::uint64_t highBits = 0x8080808080808080;
    std::uint64_t together = 0, word = 0;
    for (std::size_t i = 0; i + sizeof word <= text.size(); i += sizeof word) {
        std::memcpy(&word, text.data() + i, sizeof word);
        together |= word;
    }
    if (text.size() >= sizeof word) {
        std::memcpy(&word, text.data() + text.size() - sizeof word, sizeof word);
    } else {
        word = 0;
        std::memcpy(&word, text.data(), text.size());
    }
    return ((together | word) & highBits) == 0;
}

/// False, with `problem`, if the bytes are incomplete or malformed.
bool readBinary(BytesView bytes, Value& value, std::string& problem, PropertyListReading reading);
/// False, with `problem`, if a list cannot hold the value.
bool writeBinary(const Value& value, Bytes& bytes, std::string& problem);

} // namespace platform::plist
