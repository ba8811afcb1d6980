#include "tool/shared/arguments/QuotedText.h"

#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>

namespace {

constexpr std::string_view kBegin = "$'";
constexpr std::string_view kWhite = " \t\r\n\v\f";

struct Escape {
    char letter;
    char character;
};
constexpr Escape kEscapes[] = {{'\\', '\\'}, {'\'', '\''}, {'n', '\n'}, {'t', '\t'}, {'r', '\r'}, {'"', '"'}};

/// Reads the rest of an escape, after its backslash.
char takeEscape(std::string_view& text)
{
    const char letter = text.empty() ? '\0' : text.front();
    const auto* const known = std::ranges::find(kEscapes, letter, &Escape::letter);
    unsigned char byte = 0;
    const std::string_view digits = text.substr(std::min<std::size_t>(1, text.size()), 2);
    if (known != std::end(kEscapes)) {
        text.remove_prefix(1);
        return known->character;
    }
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), byte, 16);
    if (letter != 'x' || result.ec != std::errc() || result.ptr != digits.data() + 2)
        throw UsageError(fmt::format("$'…' knows no \"\\{}\"; it has \\\\, \\', \\n, \\t, \\r and \\xNN",
                                     printable(text.substr(0, 1))));
    text.remove_prefix(3);
    return static_cast<char>(byte);
}

} // namespace

std::string quotedText(std::string_view text, std::string_view separators)
{
    const std::string shown = printable(text);
    const bool isPlain = shown == text && !isQuoted(text) && text.find_first_of(separators) == std::string_view::npos &&
                         (text.empty() || (kWhite.find(text.front()) == std::string_view::npos &&
                                           kWhite.find(text.back()) == std::string_view::npos));
    if (isPlain)
        return shown;
    std::string quoted(kBegin);
    while (!text.empty()) {
        const std::size_t plain = std::min(text.find_first_of("\\'\n\t\r"), text.size());
        quoted += printable(text.substr(0, plain));
        text.remove_prefix(plain);
        if (text.empty())
            break;
        quoted += '\\';
        quoted += std::ranges::find(kEscapes, text.front(), &Escape::character)->letter;
        text.remove_prefix(1);
    }
    return quoted + "'";
}

bool isQuoted(std::string_view text)
{
    return text.starts_with(kBegin);
}

std::string takeQuotedText(std::string_view& text)
{
    std::string meant;
    for (text.remove_prefix(kBegin.size()); !text.empty();) {
        const char character = text.front();
        text.remove_prefix(1);
        if (character == '\'')
            return meant;
        meant += character == '\\' ? takeEscape(text) : character;
    }
    throw UsageError("a value that begins with $' goes on to the next '; \\' stands for one inside");
}
