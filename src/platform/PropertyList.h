// Property lists: XML and the binary format 1.0, as published and as other readers take them.
#pragma once

#include "platform/core/Error.h"
#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>

namespace platform {

/// The two forms.
enum class PropertyListFormat { xml, binary };

/// How deep arrays and dictionaries may nest, in reading and writing.
inline constexpr int kPropertyListMaximumDepth = 512;

/// The bytes of a property list; the same value always gives the same bytes. Null, with `error`, for a null value,
/// text that is not UTF-8, and too deep a nesting. XML also refuses what it has no form for: control characters other
/// than tab, line feed and carriage return, U+FFFE and U+FFFF, and dates outside the years 1 to 9999. XML keeps whole
/// seconds.
KT_EXPORT std::optional<Bytes> writePropertyList(const Value& value, PropertyListFormat format, Error* error = nullptr);

/// What becomes of single values that a `Value` cannot hold, or that are malformed. `strict`: the list is refused.
/// `lenient`: an integer of more than 64 signed bits becomes the nearest real; any other such value is left out of
/// its dictionary, and is null in an array. Both refuse a list that is not whole and sound.
enum class PropertyListReading { strict, lenient };

/// Reads a list of either form, told by its first bytes. Null, with `error`, when it is not whole and sound, or holds
/// what a `Value` cannot (an integer of more than 64 signed bits, a set, an archive's UID). Of two equal keys the
/// last wins. Memory stays in proportion to the bytes: a binary list may refer to one object from many places, and is
/// refused once its unfolded values need more than 64 KiB plus 256 times its bytes. XML entities other than the five
/// predefined ones, and declarations inside the DOCTYPE, are refused.
KT_EXPORT std::optional<Value> readPropertyList(BytesView bytes, Error* error = nullptr,
                                                PropertyListReading reading = PropertyListReading::strict);

} // namespace platform
