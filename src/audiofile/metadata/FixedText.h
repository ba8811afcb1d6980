// Texts in fields of fixed size.
#pragma once

#include <algorithm>
#include <array>
#include <string>
#include <string_view>

/// A text in a field of `size` bytes, padded with NUL; a text that fills the field has no NUL. Laid out as in the
/// file.
template <std::size_t size>
struct FixedText {
    std::array<char, size> bytes{}; // as in the file

    /// The size of the field, in bytes.
    static constexpr std::size_t capacity() { return size; }
    /// The text up to the first NUL.
    std::string text() const { return std::string(bytes.begin(), std::ranges::find(bytes, '\0')); }
    /// Sets the text; false, and nothing changed, when it does not fit.
    bool set(std::string_view text)
    {
        if (text.size() > size)
            return false;
        std::ranges::fill(std::ranges::copy(text, bytes.begin()).out, bytes.end(), '\0');
        return true;
    }
    friend bool operator==(const FixedText&, const FixedText&) = default;
};
