// The mounts of this process, as the kernel lists them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace platform {

struct Mount {
    std::uint64_t id = 0;
    std::string folder; // mount point
    std::string fileSystem;
};

/// Parses one line of /proc/self/mountinfo; null for anything else.
std::optional<Mount> mountFromLine(std::string_view line);
/// The mount of the item at a path; null if it is unknown.
std::optional<Mount> mountOf(const char* path);

} // namespace platform
