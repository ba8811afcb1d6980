// Folders: what is in them, making and removing them, and when an item was changed.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <optional>
#include <string>
#include <vector>

namespace platform {

// Paths are absolute. On failure errno says why.

/// The names in a folder without "." and "..", sorted by their bytes; null when it cannot be read.
KT_EXPORT std::optional<std::vector<std::string>> namesInFolder(const std::string& path);

/// Creates a folder and the missing ones above it; true also when it is there. A symbolic link to a folder counts as
/// one.
KT_EXPORT bool createFolders(const std::string& path);

/// Removes an item with everything in it, read-only folders too. Follows no link and enters no other file system.
KT_EXPORT bool removeTree(const std::string& path);

/// When the content of the item last changed, links followed; null when that cannot be read.
KT_EXPORT std::optional<Date> modificationDate(const std::string& path);

} // namespace platform
