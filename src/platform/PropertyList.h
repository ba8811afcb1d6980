// Property lists: XML and the binary format 1.0, as public descriptions and other readers have them.
#pragma once

#include "platform/core/Error.h"
#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>

namespace platform {

enum class PropertyListFormat { xml, binary };

/// How many arrays and dictionaries may stand one within the other, reading and writing.
inline constexpr int kPropertyListMaximumDepth = 512;

/// The bytes of a property list. The same value gives the same bytes. Null, with `error`, when the value holds a null,
/// text that is not UTF-8, or too deep a nesting; XML refuses besides what it has no form for: control characters other
/// than tab, line feed and carriage return, U+FFFE and U+FFFF, and dates outside the years 1 to 9999 (it keeps whole
/// seconds).
KT_EXPORT std::optional<Bytes> writePropertyList(const Value& value, PropertyListFormat format, Error* error = nullptr);

/// What becomes of single values that a `Value` cannot hold, or that are written wrongly. `strict`: the list is
/// refused. `lenient`: an integer that needs more than 64 signed bits is read as the nearest real; anything else is
/// left out of its dictionary, and null in an array. A list that is not whole and sound is refused by both.
enum class PropertyListReading { strict, lenient };

/// Reads a list of either format, told by its first bytes. Null, with `error`, when it is not whole and sound, or holds
/// what a `Value` cannot (an integer that needs more than 64 signed bits, a set, an archive's UID). Of two equal keys
/// the last wins. Memory stays in proportion to the bytes: a binary list may refer to one object from many places, and
/// is refused once the values unfolded from it need more than 256 times its bytes and 64 KiB; XML entities other
/// than the five predefined ones, and declarations inside the DOCTYPE, are refused.
KT_EXPORT std::optional<Value> readPropertyList(BytesView bytes, Error* error = nullptr,
                                                PropertyListReading reading = PropertyListReading::strict);

} // namespace platform
