#include "platform/core/HexText.h"

std::string hexText(BytesView bytes)
{
    constexpr char digits[] = "0123456789abcdef";
    std::string text;
    text.reserve(2 * bytes.size());
    for (const std::byte byte : bytes)
        (text += digits[std::to_integer<unsigned>(byte) >> 4]) += digits[std::to_integer<unsigned>(byte) & 15];
    return text;
}
