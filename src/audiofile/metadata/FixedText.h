// Texts in fields of fixed size.
#pragma once

#include <algorithm>
#include <array>
#include <string>
#include <string_view>

/// Bytes, filled up with NUL; a text that fills the field has none. Packed as it stands in the file.
template <std::size_t size>
struct FixedText {
    std::array<char, size> bytes{};

    static constexpr std::size_t capacity() { return size; }
    /// Up to the first NUL.
    std::string text() const { return std::string(bytes.begin(), std::ranges::find(bytes, '\0')); }
    /// False, and nothing changed, of a text that has no room.
    bool set(std::string_view text)
    {
        if (text.size() > size)
            return false;
        std::ranges::fill(std::ranges::copy(text, bytes.begin()).out, bytes.end(), '\0');
        return true;
    }
    friend bool operator==(const FixedText&, const FixedText&) = default;
};
