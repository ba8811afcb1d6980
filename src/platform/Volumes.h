// The volumes that items lie on.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <optional>
#include <string>

namespace platform {

struct VolumeSpace {
    std::int64_t free = 0; // bytes that the process may use
    std::int64_t total = 0;
};

/// Of the volume that the item at a path lies on; null, with errno, when it cannot be had.
KT_EXPORT std::optional<bool> volumeIsReadOnly(const char* path);
KT_EXPORT std::optional<bool> volumeIsLocal(const char* path);
KT_EXPORT std::optional<VolumeSpace> volumeSpace(const char* path);

/// Whether a file system of this name ("nfs4", "cifs", "fuse.sshfs") keeps its files on another machine.
KT_EXPORT bool isNetworkFileSystem(const std::string& name);

} // namespace platform
