// Platform strings: nullable Unicode text, distinct from the file system's `char*`.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <compare>
#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace platform {

/// An immutable text of Unicode scalar values, or null. It is held as valid UTF-8. Null and empty are different
/// values.
class KT_EXPORT String {
public:
    String() = default;
    /// Null.
    String(std::nullptr_t) {}

    /// Null when the bytes are not valid UTF-8 (overlong forms, surrogates and values past U+10FFFF included).
    static String fromUTF8(std::string_view text);
    /// Null when a surrogate stands alone.
    static String fromUTF16(std::u16string_view text);
    /// A name or path as the file system gives it; null for a null pointer, and for bytes that are not UTF-8.
    static String fromFileSystemRepresentation(const char* path);

    /// Whether there is no text; an empty text is not null.
    bool isNull() const { return !text_; }
    /// Whether the text is empty or null.
    bool isEmpty() const { return !text_ || text_->empty(); }
    /// Whether the string is not null.
    explicit operator bool() const { return text_.has_value(); }

    /// The text in UTF-8; the empty string for null.
    const std::string& utf8() const;
    /// The text in UTF-16, host order, without a mark; empty for null.
    std::u16string utf16() const;

    /// Writes the NUL-terminated form that the file system takes. False, with `buffer` made empty if it has room for
    /// that, when the string is null, holds a NUL, or needs more than `size` bytes.
    bool getFileSystemRepresentation(char* buffer, std::size_t size) const;
    /// A size in bytes that is enough for any file-system form of this text, its terminator included.
    std::size_t maximumSizeOfFileSystemRepresentation() const;

    /// A hash that is equal for equal strings; 0 for null.
    std::size_t hash() const;

    /// Null comes before every text; texts compare by scalar value.
    friend bool operator==(const String&, const String&) = default;
    friend std::strong_ordering operator<=>(const String&, const String&) = default;

private:
    explicit String(std::string text) : text_(std::move(text)) {}
    std::optional<std::string> text_;
};

} // namespace platform
