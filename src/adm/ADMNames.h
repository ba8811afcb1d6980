// Names compared with those that are known at compile time. An element needs a dozen such comparisons, and a call for
// each would cost more than the comparison.
#pragma once

#include "platform/XMLParser.h"

#include <cstddef>
#include <cstring>
#include <optional>
#include <string_view>

namespace adm {

/// Whether the text is that name.
template <std::size_t Size>
bool is(std::string_view text, const char (&name)[Size])
{
    return text.size() == Size - 1 && std::memcmp(text.data(), name, Size - 1) == 0;
}

/// As ADMGetAttribute: null when the attribute is absent or empty.
template <std::size_t Size>
std::optional<std::string_view> attribute(const platform::XMLAttributes& attributes, const char (&name)[Size])
{
    for (const platform::XMLAttribute& each : attributes)
        if (is(each.name, name) && !each.value.empty())
            return each.value;
    return std::nullopt;
}

} // namespace adm
