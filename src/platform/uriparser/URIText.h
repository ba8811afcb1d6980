// The text of URLs: parsing (strict, RFC 3986) and percent-encoding, by uriparser.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

/// A URI reference, taken apart.
struct URIReference {
    std::string scheme; // in lower case; empty for none
    bool hasAuthority = false;
    bool hasUserOrPort = false;
    std::string host; // as in the text
    bool isAbsolutePath = false;
    bool endsInSlash = false;
    std::optional<std::string> path; // decoded; null if its escapes hide a slash or a NUL, or are not UTF-8
    std::string suffix;              // query and fragment with their marks
};

/// Null if the text is not a URI reference. Characters beyond ASCII count as escaped (RFC 3987).
std::optional<URIReference> parseURIReference(std::string_view text);

/// The text with every byte beyond ASCII percent-encoded.
std::string withEscapesBeyondASCII(std::string_view text);

/// Percent-encodes a decoded path, component by component. The path contains no NUL.
std::string percentEncodedPath(const std::string& path);

} // namespace platform
