// The walk that finds an item again by its identity, after it was renamed or moved nearby.
#pragma once

#include "platform/posix/ItemIdentity.h"

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace platform {

enum class SearchDepth { folderOnly, withSubfolders };

/// The path of the item that is proven to be `wanted`, null when it is not found. Looks through the entries of the
/// folders, in order, then through those of their subfolders, level by level, `entryLimit` entries in all. Leaves the
/// device of none of the folders, follows no symbolic link (the folders' own paths excepted), waits for no mount.
std::optional<std::string> findItem(const ItemIdentity& wanted, const std::vector<std::string>& folders,
                                    SearchDepth depth, std::size_t entryLimit);

} // namespace platform
