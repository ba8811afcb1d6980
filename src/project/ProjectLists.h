// The property lists of a package as bytes and files.
#pragma once

#include "platform/PropertyList.h"
#include "platform/core/Bytes.h"
#include "platform/core/Value.h"

#include <cstddef>
#include <optional>

/// The limit, in bytes, above which a list is not read; real ones are far below.
inline constexpr std::size_t kLargestProjectList = std::size_t{512} << 20;

/// The dictionary of a property list; null when the bytes are not one.
std::optional<platform::Dictionary>
dictionaryFromBytes(BytesView bytes, platform::PropertyListReading reading = platform::PropertyListReading::lenient);
