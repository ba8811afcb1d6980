// Comparison of names without regard to ASCII case: byte by byte, the same on every host, whatever its locale.
#pragma once

#include <algorithm>
#include <string_view>

/// A to Z as a to z, any other byte as it is.
constexpr char asciiLower(char c)
{
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

/// Whether two names are equal but for ASCII case.
constexpr bool equalIgnoringASCIICase(std::string_view a, std::string_view b)
{
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](char x, char y) { return asciiLower(x) == asciiLower(y); });
}
