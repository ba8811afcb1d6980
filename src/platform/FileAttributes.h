// What an open file has beside its content: owner, permissions, times, extended attributes.
#pragma once

#include "platform/FileDates.h"
#include "platform/core/Export.h"

#include <cstdint>
#include <string>

namespace platform {

/// Owner, permissions and times of an open file.
struct FileAttributes {
    std::uint32_t owner = 0;       // number of the user
    std::uint32_t group = 0;       // number of the group
    std::uint32_t permissions = 0; // the low 12 mode bits
    FileTime accessed;             // when the content was last read
    FileTime modified;             // when the content last changed
};

// On failure errno says why.

/// Reads the attributes of an open file. False, with errno, on failure.
KT_EXPORT bool fileAttributes(int descriptor, FileAttributes& attributes);
/// Sets the low 12 mode bits. False, with errno, on failure.
KT_EXPORT bool setPermissions(int descriptor, std::uint32_t permissions);
/// Sets the times of the last access and the last modification, the latter to now without `modified`. False, with
/// errno, on failure.
KT_EXPORT bool setFileTimes(int descriptor, const FileTime& accessed, const FileTime* modified);
/// Gives `to` the extended attributes of `from`; those that only the system may set, as far as it allows. False, with
/// errno, when one is lost: `lost` is its name, or empty when they cannot be read at all.
KT_EXPORT bool copyExtendedAttributes(int from, int to, std::string& lost);

} // namespace platform
