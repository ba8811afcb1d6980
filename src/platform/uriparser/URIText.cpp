#include "platform/uriparser/URIText.h"

#include "platform/String.h"
#include "platform/core/ASCIICase.h"

#include <uriparser/Uri.h>

#include <algorithm>
#include <memory>

namespace platform {

namespace {

std::string_view textOfRange(const UriTextRangeA& range)
{
    return range.first == nullptr ? std::string_view() : std::string_view(range.first, range.afterLast);
}

/// Appends a path segment without its escapes; false if they hide a slash or a NUL.
bool appendUnescaped(std::string& path, std::string_view segment)
{
    std::string text(segment);
    const char* end = uriUnescapeInPlaceExA(text.data(), URI_FALSE, URI_BR_DONT_TOUCH);
    text.resize(static_cast<std::size_t>(end - text.data()));
    path += text;
    return text.find('/') == text.npos && text.find('\0') == text.npos;
}

std::optional<std::string> decodedPath(const UriUriA& uri, bool isAbsolute)
{
    std::string path(isAbsolute ? "/" : "");
    for (const UriPathSegmentA* segment = uri.pathHead; segment != nullptr; segment = segment->next) {
        if (segment != uri.pathHead)
            path += '/';
        if (!appendUnescaped(path, textOfRange(segment->text)))
            return std::nullopt;
    }
    if (String::fromUTF8(path).isNull())
        return std::nullopt;
    return path;
}

} // namespace

std::string withEscapesBeyondASCII(std::string_view text)
{
    constexpr std::string_view digits = "0123456789ABCDEF";
    std::string escaped;
    escaped.reserve(text.size());
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x80)
            escaped += c;
        else
            ((escaped += '%') += digits[byte >> 4]) += digits[byte & 15];
    }
    return escaped;
}

std::optional<URIReference> parseURIReference(std::string_view text)
{
    const std::string escaped = withEscapesBeyondASCII(text);
    UriUriA uri;
    if (uriParseSingleUriExA(&uri, escaped.data(), escaped.data() + escaped.size(), nullptr) != URI_SUCCESS)
        return std::nullopt;
    const std::unique_ptr<UriUriA, decltype(&uriFreeUriMembersA)> freed(&uri, uriFreeUriMembersA);

    URIReference parsed;
    parsed.scheme = textOfRange(uri.scheme);
    std::transform(parsed.scheme.begin(), parsed.scheme.end(), parsed.scheme.begin(), asciiLower);
    parsed.hasAuthority = uri.hostText.first != nullptr;
    parsed.hasUserOrPort = uri.userInfo.first != nullptr || uri.portText.first != nullptr;
    parsed.host = textOfRange(uri.hostText);
    parsed.isAbsolutePath = uri.absolutePath == URI_TRUE || (parsed.hasAuthority && uri.pathHead != nullptr);
    parsed.endsInSlash = uri.pathTail == nullptr ? parsed.isAbsolutePath : textOfRange(uri.pathTail->text).empty();
    parsed.path = decodedPath(uri, parsed.isAbsolutePath);
    if (uri.query.first != nullptr)
        (parsed.suffix += '?') += textOfRange(uri.query);
    if (uri.fragment.first != nullptr)
        (parsed.suffix += '#') += textOfRange(uri.fragment);
    return parsed;
}

std::string percentEncodedPath(const std::string& path)
{
    constexpr std::string_view prefix = "file://"; // uriparser puts it before an absolute path
    std::string text(prefix.size() + 3 * path.size() + 1, '\0');
    uriUnixFilenameToUriStringA(path.c_str(), text.data());
    text.resize(text.find('\0'));
    if (path.starts_with('/'))
        text.erase(0, prefix.size());
    return text;
}

} // namespace platform
