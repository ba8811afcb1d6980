#include "tool/page/PageLink.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>

std::string percentEncoded(std::string_view path)
{
    constexpr std::string_view plain = "-._~/";
    std::string text;
    for (const char byte : path) {
        const bool isWord =
            (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z') || (byte >= '0' && byte <= '9');
        if (isWord || plain.find(byte) != plain.npos)
            text += byte;
        else
            fmt::format_to(std::back_inserter(text), "%{:02X}", static_cast<unsigned char>(byte));
    }
    return text;
}

std::string_view commonFolder(std::string_view one, std::string_view other)
{
    const auto differing = std::ranges::mismatch(one, other).in1;
    const std::string_view same = one.substr(0, static_cast<std::size_t>(differing - one.begin()));
    return same.substr(0, same.rfind('/') + 1);
}

std::string linkToFolder(std::string_view from, std::string_view to)
{
    const std::size_t shared = commonFolder(from, to).size();
    std::string link;
    for (const char byte : from.substr(shared))
        if (byte == '/')
            link += "../";
    return link + percentEncoded(to.substr(shared));
}
