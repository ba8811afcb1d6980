// The volumes that items lie on.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <optional>
#include <string>

namespace platform {

/// The space of a volume, in bytes.
struct VolumeSpace {
    std::int64_t free = 0;  // bytes that the process may use
    std::int64_t total = 0; // bytes in all
};

/// Whether the volume of the item at a path is read-only; null, with errno, on failure.
KT_EXPORT std::optional<bool> volumeIsReadOnly(const char* path);
/// Whether its files are on this machine; null, with errno, on failure.
KT_EXPORT std::optional<bool> volumeIsLocal(const char* path);
/// The space of the volume of the item at a path; null, with errno, on failure.
KT_EXPORT std::optional<VolumeSpace> volumeSpace(const char* path);

/// Whether a file system of this name ("nfs4", "cifs", "fuse.sshfs") keeps its files on another machine.
KT_EXPORT bool isNetworkFileSystem(const std::string& name);

} // namespace platform
