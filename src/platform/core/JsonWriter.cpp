#include "platform/core/JsonWriter.h"

#include "platform/core/DateText.h"
#include "platform/core/UTF8.h"

#include <algorithm>

namespace {

constexpr std::size_t kShort = 256; // longer texts may be written in several pieces

constexpr std::uint64_t eight(unsigned char c)
{
    return 0x0101010101010101U * c;
}

/// Whether one of eight bytes, all below 0x80, is below `c`.
constexpr bool anyBelow(std::uint64_t bytes, unsigned char c)
{
    return ((bytes - eight(c)) & eight(0x80)) != 0;
}

/// Whether the text needs no escapes: printable ASCII without quotation marks and backslashes.
bool isPlain(std::string_view text)
{
    for (std::size_t i = 0; i < text.size(); i += sizeof(std::uint64_t)) {
        std::uint64_t bytes = eight('a');
        std::memcpy(&bytes, text.data() + i, std::min(sizeof bytes, text.size() - i));
        if ((bytes & eight(0x80)) != 0 || anyBelow(bytes, 0x20) || anyBelow(bytes ^ eight('"'), 1) ||
            anyBelow(bytes ^ eight('\\'), 1) || anyBelow(bytes ^ eight(0x7F), 1))
            return false;
    }
    return true;
}

std::string base64(const Bytes& bytes)
{
    constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string text;
    for (std::size_t i = 0; i < bytes.size(); i += 3) {
        unsigned group = 0;
        for (std::size_t j = 0; j < 3; ++j)
            group = group << 8 | (i + j < bytes.size() ? std::to_integer<unsigned>(bytes[i + j]) : 0);
        for (std::size_t j = 0; j < 4; ++j)
            text += i + j > bytes.size() ? '=' : digits[group >> (18 - 6 * j) & 63];
    }
    return text;
}

/// "\\u00ad", of a code below 0x10000.
std::string_view escapeOf(std::uint32_t code, char (&text)[6])
{
    constexpr char digits[] = "0123456789abcdef";
    text[0] = '\\';
    text[1] = 'u';
    for (std::size_t i = 0; i < 4; ++i)
        text[2 + i] = digits[code >> (12 - 4 * i) & 15];
    return {text, sizeof text};
}

} // namespace

JsonWriter& JsonWriter::write(std::string_view text)
{
    const bool plain = isPlain(text);
    separate();
    if (plain && text.size() < kShort) {
        char* const to = room(text.size() + 2);
        to[0] = '"';
        std::memcpy(to + 1, text.data(), text.size());
        to[text.size() + 1] = '"';
        advance(text.size() + 2);
    } else {
        put('"');
        if (plain)
            put(text);
        else
            putEscaped(text);
        put('"');
    }
    isFirst_ = false;
    return *this;
}

void JsonWriter::putEscaped(std::string_view text)
{
    constexpr std::string_view kEscaped = "\"\\\b\f\n\r\t", kLetters = "\"\\bfnrt";
    while (!text.empty()) {
        std::string_view bytes = text;
        const char32_t code = platform::takeCharacter(text);
        bytes.remove_suffix(text.size());
        if (const std::size_t found = kEscaped.find(bytes); found != kEscaped.npos) {
            put('\\');
            put(kLetters[found]);
        } else if (code >= 0x20 && !platform::isLateControl(code) && !platform::isUnseen(code)) {
            put(code == 0xFFFD ? "\xEF\xBF\xBD" : bytes);
        } else if (const auto number = static_cast<std::uint32_t>(code); number < 0x10000) {
            char escape[6];
            put(escapeOf(number, escape));
        } else { // as a pair of surrogates
            char escape[6];
            put(escapeOf(0xD7C0 + (number >> 10), escape));
            put(escapeOf(0xDC00 + (number & 0x3FF), escape));
        }
    }
}

JsonWriter& JsonWriter::write(double value)
{
    if (!std::isfinite(value))
        return writeNull();
    constexpr double kLeast = 1e-4, kMost = 1e15; // outside this range, numbers have an exponent
    const double size = std::fabs(value);
    const bool isFixed = size == 0 || (size >= kLeast && size < kMost);
    char text[40];
    const char* const end = std::to_chars(text, text + sizeof text, value,
                                          isFixed ? std::chars_format::fixed : std::chars_format::scientific)
                                .ptr;
    const std::string_view number(text, static_cast<std::size_t>(end - text));
    append(number);
    if (isFixed && number.find('.') == number.npos)
        put(".0");
    return *this;
}

JsonWriter& JsonWriter::write(const platform::Value& value)
{
    const auto one = [this](const auto& content) {
        using Content = std::decay_t<decltype(content)>;
        if constexpr (std::is_same_v<Content, std::monostate>) {
            writeNull();
        } else if constexpr (std::is_same_v<Content, Bytes>) {
            write(base64(content));
        } else if constexpr (std::is_same_v<Content, platform::Date>) {
            write(platform::dateText(content));
        } else if constexpr (std::is_same_v<Content, platform::Dictionary>) {
            beginObject();
            for (const auto& [key, element] : content)
                member(key, element);
            endObject();
        } else {
            write(content);
        }
    };
    std::visit(one, value.variant());
    return *this;
}
