// Property lists: XML and the binary format 1.0, as public descriptions and other readers have them.
#pragma once

#include "platform/core/Error.h"
#include "platform/core/Value.h"

#include <optional>

namespace platform {

enum class PropertyListFormat { xml, binary };

/// The bytes of a property list; null, with `error`, when the value holds a null or text that is not UTF-8.
KT_EXPORT std::optional<Bytes> writePropertyList(const Value& value, PropertyListFormat format,
                                                 Error* error = nullptr);

/// Reads a list of either format, told by its first bytes. Memory stays in proportion to the bytes: nesting is limited
/// to 512 levels, a binary list that refers to one object from many places is refused once the values unfolded from
/// it pass a multiple of its size, and XML entities other than the five predefined ones are refused.
KT_EXPORT std::optional<Value> readPropertyList(BytesView bytes, Error* error = nullptr);

} // namespace platform
