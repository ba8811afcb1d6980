// Platform strings over std::string. File systems here store UTF-8 as it is, without normalization.
#include "platform/String.h"

#include <cstdint>
#include <cstring>
#include <functional>

namespace platform {

namespace {

constexpr char32_t kLastScalar = 0x10FFFF;

constexpr bool isSurrogate(char32_t value)
{
    return value >= 0xD800 && value <= 0xDFFF;
}

/// Reads one scalar value at `at`, before `end`, and moves `at` past it. False if the bytes are not well-formed (The
/// Unicode Standard, table 3-7).
bool readScalar(const char*& at, const char* end, char32_t& scalar)
{
    const auto lead = static_cast<unsigned char>(*at++);
    if (lead < 0x80) {
        scalar = lead;
        return true;
    }
    const int trailing = lead >= 0xF0 ? 3 : lead >= 0xE0 ? 2 : 1;
    if (lead < 0xC2 || lead > 0xF4 || end - at < trailing)
        return false;
    scalar = lead & (0x3Fu >> trailing);
    for (int i = 0; i < trailing; ++i) {
        const auto byte = static_cast<unsigned char>(*at++);
        if ((byte & 0xC0) != 0x80)
            return false;
        scalar = scalar << 6 | (byte & 0x3Fu);
    }
    constexpr char32_t smallest[] = {0, 0x80, 0x800, 0x10000};
    return scalar >= smallest[trailing] && scalar <= kLastScalar && !isSurrogate(scalar);
}

/// Moves `at` past the ASCII that begins there, eight bytes at a time; may stop up to seven bytes early.
void skipASCII(const char*& at, const char* end)
{
    std::uint64_t eight;
    for (; end - at >= 8; at += 8) {
        std::memcpy(&eight, at, sizeof eight);
        if ((eight & 0x8080808080808080u) != 0)
            return;
    }
}

bool isWellFormed(std::string_view text)
{
    const char* at = text.data();
    const char* const end = at + text.size();
    char32_t scalar;
    for (skipASCII(at, end); at != end; skipASCII(at, end))
        if (!readScalar(at, end, scalar))
            return false;
    return true;
}

void appendScalar(std::string& text, char32_t scalar)
{
    const auto append = [&](char32_t byte) { text += static_cast<char>(byte); };
    const auto appendTrailing = [&](int shift) { append(0x80 | (scalar >> shift & 0x3F)); };
    if (scalar < 0x80)
        return append(scalar);
    if (scalar < 0x800) {
        append(0xC0 | scalar >> 6);
    } else if (scalar < 0x10000) {
        append(0xE0 | scalar >> 12);
        appendTrailing(6);
    } else {
        append(0xF0 | scalar >> 18);
        appendTrailing(12);
        appendTrailing(6);
    }
    appendTrailing(0);
}

} // namespace

String String::fromUTF8(std::string_view text)
{
    return isWellFormed(text) ? String(std::string(text)) : String();
}

String String::fromUTF16(std::u16string_view text)
{
    std::string utf8;
    utf8.reserve(text.size());
    for (std::size_t i = 0; i < text.size(); ++i) {
        char32_t scalar = text[i];
        if (isSurrogate(scalar)) {
            if (scalar >= 0xDC00 || i + 1 == text.size() || (text[i + 1] & 0xFC00) != 0xDC00)
                return nullptr;
            scalar = 0x10000 + ((scalar & 0x3FF) << 10) + (text[++i] & 0x3FFu);
        }
        appendScalar(utf8, scalar);
    }
    return String(std::move(utf8));
}

String String::fromFileSystemRepresentation(const char* path)
{
    return path == nullptr ? String() : fromUTF8(path);
}

const std::string& String::utf8() const
{
    static const std::string none;
    return text_ ? *text_ : none;
}

std::u16string String::utf16() const
{
    const std::string& text = utf8();
    std::u16string units;
    units.reserve(text.size());
    char32_t scalar;
    for (const char *at = text.data(), *end = at + text.size(); at != end && readScalar(at, end, scalar);) {
        if (scalar < 0x10000) {
            units += static_cast<char16_t>(scalar);
        } else {
            units += static_cast<char16_t>(0xD800 + ((scalar - 0x10000) >> 10));
            units += static_cast<char16_t>(0xDC00 + (scalar & 0x3FF));
        }
    }
    return units;
}

bool String::getFileSystemRepresentation(char* buffer, std::size_t size) const
{
    if (buffer == nullptr || size == 0)
        return false;
    buffer[0] = '\0';
    const std::string& text = utf8();
    if (isNull() || text.size() >= size || text.find('\0') != text.npos)
        return false;
    std::memcpy(buffer, text.c_str(), text.size() + 1);
    return true;
}

std::size_t String::maximumSizeOfFileSystemRepresentation() const
{
    return utf8().size() + 1;
}

std::size_t String::hash() const
{
    return text_ ? std::hash<std::string>{}(*text_) : 0;
}

} // namespace platform
