// Expected bytes, written and compared as hex.
#pragma once

#include "platform/core/Bytes.h"

#include <stdexcept>
#include <string>
#include <string_view>

inline std::string toHex(BytesView bytes)
{
    constexpr char digits[] = "0123456789abcdef";
    std::string text;
    for (const std::byte byte : bytes)
        text += {digits[std::to_integer<unsigned>(byte) >> 4], digits[std::to_integer<unsigned>(byte) & 15]};
    return text;
}

/// Hex digits as from `toHex`, without the blanks that group them for readers.
inline std::string hex(std::string grouped)
{
    std::erase(grouped, ' ');
    return grouped;
}

/// Pairs of hex digits with blanks among them; throws on anything else.
inline Bytes fromHex(std::string_view grouped)
{
    const std::string digits = hex(std::string(grouped));
    if (digits.size() % 2 != 0)
        throw std::invalid_argument("odd number of hex digits");
    Bytes bytes;
    for (std::size_t i = 0; i < digits.size(); i += 2)
        bytes.push_back(static_cast<std::byte>(std::stoi(digits.substr(i, 2), nullptr, 16)));
    return bytes;
}
