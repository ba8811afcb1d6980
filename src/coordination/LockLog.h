// The lines in which the tables are shown to people.
#pragma once

#include <cstdint>
#include <string>

namespace locklog {

inline std::string yesOrNo(bool yes)
{
    return yes ? "YES" : "NO ";
}

/// At least three characters wide.
inline std::string countText(std::int64_t count)
{
    const std::string digits = std::to_string(count);
    return std::string(digits.size() < 3 ? 3 - digits.size() : 0, ' ') + digits;
}

} // namespace locklog
