// The lines that show the tables to people.
#pragma once

#include <cstdint>
#include <string>

/// Texts in those lines.
namespace locklog {

/// "YES" or "NO ", three characters wide.
inline std::string yesOrNo(bool yes)
{
    return yes ? "YES" : "NO ";
}

/// The count, at least three characters wide.
inline std::string countText(std::int64_t count)
{
    const std::string digits = std::to_string(count);
    return std::string(digits.size() < 3 ? 3 - digits.size() : 0, ' ') + digits;
}

} // namespace locklog
