#include "tool/shared/output/ShownName.h"

#include "platform/String.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <iterator>
#include <sys/stat.h>

namespace {

bool isUTF8(std::string_view text)
{
    const bool isASCII = std::ranges::all_of(text, [](char c) { return static_cast<signed char>(c) >= 0; });
    return isASCII || !platform::String::fromUTF8(text).isNull(); // most are ASCII, which needs no copy to check
}

bool isThere(const std::string& path)
{
    struct stat status = {};
    return ::lstat(path.c_str(), &status) == 0;
}

void appendEscaped(std::string& text, char byte)
{
    fmt::format_to(std::back_inserter(text), "\\x{:02X}", static_cast<unsigned char>(byte));
}

/// Length of the UTF-8 character that `text` begins with; 0 if there is none.
std::size_t characterLength(std::string_view text)
{
    for (std::size_t length = 1; length <= std::min<std::size_t>(text.size(), 4); ++length)
        if (isUTF8(text.substr(0, length)))
            return length;
    return 0;
}

std::string escaped(std::string_view name)
{
    std::string text;
    while (!name.empty()) {
        const std::size_t length = characterLength(name);
        if (length == 0 || name.front() == '\\')
            appendEscaped(text, name.front());
        else
            text += name.substr(0, length);
        name.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return text;
}

/// Escapes every byte of the last component; no other file has such a name.
std::string escapedThroughout(std::string_view name)
{
    const std::size_t last = name.rfind('/') + 1;
    std::string text = escaped(name.substr(0, last));
    for (const char byte : name.substr(last))
        appendEscaped(text, byte);
    return text;
}

/// Escapes must not hide a slash or a NUL.
std::string withoutEscapes(std::string_view text)
{
    std::string name;
    while (!text.empty()) {
        unsigned byte = 0;
        const bool isEscape = text.size() >= 4 && text.starts_with("\\x") &&
                              std::from_chars(text.data() + 2, text.data() + 4, byte, 16).ptr == text.data() + 4 &&
                              byte != 0 && byte != '/';
        name += isEscape ? static_cast<char>(byte) : text.front();
        text.remove_prefix(isEscape ? 4 : 1);
    }
    return name;
}

} // namespace

std::string shownName(const std::string& name)
{
    if (isUTF8(name))
        return name;
    std::string text = escaped(name);
    return isThere(text) ? escapedThroughout(name) : text;
}

std::string nameMeantBy(const std::string& argument)
{
    if (argument.find("\\x") == std::string::npos || isThere(argument))
        return argument;
    const std::string name = withoutEscapes(argument);
    if (!isThere(name))
        return argument;
    return name == "-" ? "./-" : name;
}
