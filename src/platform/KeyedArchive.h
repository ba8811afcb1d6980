// Keyed archives: a dictionary of texts, numbers and bytes as one block. Here a binary property list of the dictionary.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>

namespace platform {

/// Null when the dictionary holds what no property list can (a null value, text that is not UTF-8).
KT_EXPORT std::optional<Bytes> archiveDictionary(const Dictionary& dictionary);
/// Null when the bytes are not an archive of a dictionary. Only property-list values come back, so that an archive from
/// anywhere can be opened safely.
KT_EXPORT std::optional<Dictionary> unarchiveDictionary(BytesView archive);

} // namespace platform
