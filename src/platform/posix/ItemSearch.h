// Finds an item again by its identity after it was renamed or moved nearby.
#pragma once

#include "platform/posix/ItemIdentity.h"

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace platform {

enum class SearchDepth { folderOnly, withSubfolders };

/// The path of the item that is proven to be `wanted`; null if it is not found. Searches the folders in order, then
/// their subfolders level by level, up to `entryLimit` entries in all. Stays on the devices of the folders, follows no
/// symbolic link except in the folders' own paths, and waits for no mount.
std::optional<std::string> findItem(const ItemIdentity& wanted, const std::vector<std::string>& folders,
                                    SearchDepth depth, std::size_t entryLimit);

} // namespace platform
