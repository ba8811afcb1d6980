// What an open file has beside its content: owner, permissions, times, extended attributes.
#pragma once

#include "platform/FileDates.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <string>

namespace platform {

struct FileAttributes {
    std::uint32_t owner = 0, group = 0;
    std::uint32_t permissions = 0; // the low 12 mode bits
    FileTime accessed, modified;
};

// On failure errno says why.

KT_EXPORT bool fileAttributes(int descriptor, FileAttributes& attributes);
KT_EXPORT bool setPermissions(int descriptor, std::uint32_t permissions);
/// Those of the last access and of the last modification; without `modified` the latter is now.
KT_EXPORT bool setFileTimes(int descriptor, const FileTime& accessed, const FileTime* modified);
/// Gives `to` the extended attributes of `from`; those that the system keeps for itself as far as they can be set. On
/// failure `lost` is the name of one that cannot be kept, or empty.
KT_EXPORT bool copyExtendedAttributes(int from, int to, std::string& lost);

} // namespace platform
