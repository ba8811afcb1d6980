// The colon and Windows path styles, to and from decoded POSIX paths.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

struct HostPath {
    std::string host; // lower case; empty for a path on this system
    std::string path; // POSIX style
};

/// Parses a path in that style; null if the style's rules (URL.h) give none. The text is not empty and contains no NUL.
std::optional<HostPath> readWindowsPath(std::string_view text);
std::optional<std::string> readColonPath(std::string_view text);

/// The path in that style; null if it would be read as another path. Slashes in the path are single, and only the root
/// ends with one.
std::optional<std::string> windowsPath(std::string_view host, std::string_view path);
std::optional<std::string> colonPath(std::string_view path);

/// Whether a URL may name the host: letters, digits, "-", ".", "_" and "~".
bool isHostName(std::string_view host);

} // namespace platform
