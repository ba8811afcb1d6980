// Four-character codes: chunk ids, container ids, form types and file types.
#pragma once

#include <cstdint>
#include <string>

/// An unsigned 32-bit value whose most significant byte is the first character, in every container, whatever its byte
/// order: "FORM" is 0x464F524D.
using FourCC = std::uint32_t;

/// The code of four characters, in file order.
constexpr FourCC fourCC(char a, char b, char c, char d)
{
    return FourCC{static_cast<unsigned char>(a)} << 24 | FourCC{static_cast<unsigned char>(b)} << 16 |
           FourCC{static_cast<unsigned char>(c)} << 8 | FourCC{static_cast<unsigned char>(d)};
}

/// The code of a literal of exactly four characters: `fourCC("FORM")`.
constexpr FourCC fourCC(const char (&text)[5])
{
    return fourCC(text[0], text[1], text[2], text[3]);
}

/// The four characters of `code`; a backslash, and a byte that is not printable ASCII, as `\\xNN`.
inline std::string fourCCText(FourCC code)
{
    constexpr char digits[] = "0123456789ABCDEF";
    std::string text;
    for (int shift = 24; shift >= 0; shift -= 8) {
        const auto byte = static_cast<unsigned char>(code >> shift);
        if (byte >= 0x20 && byte < 0x7F && byte != '\\')
            text += static_cast<char>(byte);
        else
            (text += "\\x") += {digits[byte >> 4], digits[byte & 15]};
    }
    return text;
}
