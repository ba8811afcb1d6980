// Golden bytes, written and compared as hex.
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

/// Pairs of hex digits; throws on anything else.
inline Bytes fromHex(std::string_view hex)
{
    if (hex.size() % 2 != 0)
        throw std::invalid_argument("odd number of hex digits");
    Bytes bytes;
    for (std::size_t i = 0; i < hex.size(); i += 2)
        bytes.push_back(static_cast<std::byte>(std::stoi(std::string(hex.substr(i, 2)), nullptr, 16)));
    return bytes;
}
