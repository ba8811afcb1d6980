// The property lists of a package as bytes and files.
#pragma once

#include "platform/PropertyList.h"
#include "platform/core/Bytes.h"
#include "platform/core/Value.h"

#include <cstddef>
#include <optional>

/// No list of a project comes near it; a file that claims to be longer is not read.
inline constexpr std::size_t kLargestProjectList = std::size_t{512} << 20;

/// Null for what is no property list of a dictionary.
std::optional<platform::Dictionary>
dictionaryFromBytes(BytesView bytes, platform::PropertyListReading reading = platform::PropertyListReading::lenient);
