// Folders: what is in them, making and removing them, and when an item was changed.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>
#include <string>
#include <vector>

namespace platform {

// Paths are absolute. On failure errno says why.

/// The names in a folder, "." and ".." left out, sorted by their bytes; null when it cannot be read.
KT_EXPORT std::optional<std::vector<std::string>> namesInFolder(const std::string& path);

/// Creates a folder and those above it, as far as they are missing. A symbolic link to a folder is one.
KT_EXPORT bool createFolders(const std::string& path);

/// Removes an item with all that is in it, read-only folders too. No link is followed, and no other file system
/// entered.
KT_EXPORT bool removeTree(const std::string& path);

/// When the content of the item was last changed, links followed; null when it cannot be had.
KT_EXPORT std::optional<Date> modificationDate(const std::string& path);

} // namespace platform
