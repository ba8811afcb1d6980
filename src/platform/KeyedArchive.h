// Keyed archives: a dictionary of texts, numbers and bytes as one block, here a binary property list.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>

namespace platform {

/// The archive of a dictionary; null when the dictionary holds what no property list can (a null value, text that is
/// not UTF-8).
KT_EXPORT std::optional<Bytes> archiveDictionary(const Dictionary& dictionary);
/// The dictionary of an archive; null when the bytes are not one. Only property-list values come back, so that an
/// archive of any origin can be opened safely.
KT_EXPORT std::optional<Dictionary> unarchiveDictionary(BytesView archive);

} // namespace platform
