#include "platform/uriparser/PathStyles.h"

#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <iterator>
#include <vector>

namespace platform {

namespace {

constexpr std::string_view kVolumes = "/Volumes/";

bool isLetter(char c)
{
    return asciiLower(c) >= 'a' && asciiLower(c) <= 'z';
}

/// Whether `text` begins like a drive: "C:".
bool beginsWithDrive(std::string_view text)
{
    return text.size() >= 2 && isLetter(text[0]) && text[1] == ':';
}

std::vector<std::string_view> components(std::string_view text, char separator)
{
    std::vector<std::string_view> found;
    for (std::size_t end; (end = text.find(separator)) != text.npos; text.remove_prefix(end + 1))
        found.push_back(text.substr(0, end));
    found.push_back(text);
    return found;
}

/// Exchanges the characters that stand for each other in colon and POSIX names.
char exchangedInName(char c)
{
    return c == '/' ? ':' : c == ':' ? '/' : c;
}

} // namespace

bool isHostName(std::string_view host)
{
    return !host.empty() && std::all_of(host.begin(), host.end(), [](char c) {
        return isLetter(c) || (c >= '0' && c <= '9') || std::string_view("-._~").find(c) != std::string_view::npos;
    });
}

std::optional<HostPath> readWindowsPath(std::string_view text)
{
    HostPath read{{}, std::string(text)};
    std::replace(read.path.begin(), read.path.end(), '\\', '/');
    if (beginsWithDrive(read.path)) {
        if (read.path.size() > 2 && read.path[2] != '/')
            return std::nullopt;
        read.path.insert(0, 1, '/');
    } else if (read.path.starts_with("//")) {
        const std::size_t end = std::min(read.path.find('/', 2), read.path.size());
        read.host = read.path.substr(2, end - 2);
        if (!isHostName(read.host))
            return std::nullopt;
        std::transform(read.host.begin(), read.host.end(), read.host.begin(), asciiLower);
        read.path.erase(0, end);
        if (read.path.empty())
            read.path = "/";
    }
    return read;
}

std::optional<std::string> windowsPath(std::string_view host, std::string_view path)
{
    const bool isAbsolute = path.starts_with('/');
    if (path.find('\\') != path.npos || (!isAbsolute && beginsWithDrive(path)))
        return std::nullopt;
    std::string text(path);
    if (!host.empty()) {
        text.insert(0, "//").insert(2, host);
    } else if (isAbsolute && beginsWithDrive(path.substr(1)) && (path.size() == 3 || path[3] == '/')) {
        text.erase(0, 1);
        if (text.size() == 2)
            text += '/';
    }
    std::replace(text.begin(), text.end(), '/', '\\');
    return text;
}

std::optional<std::string> readColonPath(std::string_view text)
{
    const bool isAbsolute = !text.starts_with(':');
    if (!isAbsolute)
        text.remove_prefix(1);
    std::vector<std::string_view> names = components(text, ':');
    if (names.back().empty()) // one colon may follow the last name
        names.pop_back();

    std::string path(isAbsolute ? kVolumes.substr(0, kVolumes.size() - 1) : "");
    int depth = 0;
    for (const std::string_view name : names) {
        const std::string_view component = name.empty() ? ".." : name;
        depth += name.empty() ? -1 : 1;
        if (name == "." || name == ".." || (isAbsolute && depth < 1)) // the volume counts as one
            return std::nullopt;
        if (isAbsolute || !path.empty())
            path += '/';
        std::transform(component.begin(), component.end(), std::back_inserter(path), exchangedInName);
    }
    return path.empty() ? "." : path;
}

std::optional<std::string> colonPath(std::string_view path)
{
    const bool isAbsolute = path.starts_with('/');
    if (isAbsolute && !path.starts_with(kVolumes))
        return std::nullopt;
    std::string text;
    int depth = 0;
    std::size_t count = 0;
    for (const std::string_view component : components(path.substr(isAbsolute ? kVolumes.size() : 0), '/')) {
        if (component == ".")
            continue;
        depth += component == ".." ? -1 : 1;
        if (isAbsolute && depth < 1)
            return std::nullopt;
        if (count++ > 0 || !isAbsolute)
            text += ':';
        if (component != "..")
            std::transform(component.begin(), component.end(), std::back_inserter(text), exchangedInName);
    }
    if (isAbsolute && count == 0)
        return std::nullopt;
    // A path that ends without a name, and a volume alone, keep their colon.
    if (text.empty() || text.ends_with(':') || (isAbsolute && count == 1))
        text += ':';
    return text;
}

} // namespace platform
