// The colon and Windows path styles, to and from decoded POSIX paths.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

struct HostPath {
    std::string host; // in lower case; empty for a path on this system
    std::string path; // POSIX style
};

/// A path as text in a style, read; null where the style's rules (URL.h) give none. Not empty, and without a NUL.
std::optional<HostPath> readWindowsPath(std::string_view text);
std::optional<std::string> readColonPath(std::string_view text);

/// A path as text in a style; null when that would be read as another path. Slashes in the path are single, and none
/// is at its end but the root's.
std::optional<std::string> windowsPath(std::string_view host, std::string_view path);
std::optional<std::string> colonPath(std::string_view path);

/// A host that URLs may name: letters, digits, "-", ".", "_" and "~".
bool isHostName(std::string_view host);

} // namespace platform
