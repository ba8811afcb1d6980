#include "adm/ADMText.h"

#include <charconv>
#include <cstdio>
#include <iterator>
#include <limits>

namespace adm {

namespace {

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

/// Removes a leading sign; true for a minus.
bool takeSign(std::string_view& text)
{
    const bool isMinus = text.starts_with('-');
    if (isMinus || text.starts_with('+'))
        text.remove_prefix(1);
    return isMinus;
}

/// Zero or infinity for a number outside the range of `float`: by its value as a `double` if it has one, else by its
/// exponent.
float outOfRange(std::string_view text)
{
    double wide = 0;
    if (std::from_chars(text.data(), text.data() + text.size(), wide).ec == std::errc())
        return wide < 1 ? 0 : std::numeric_limits<float>::infinity();
    const std::size_t exponent = text.find_first_of("eE");
    const bool isSmall = exponent != text.npos ? text.substr(exponent + 1).starts_with('-') : text.find('.') <= 1;
    return isSmall ? 0 : std::numeric_limits<float>::infinity();
}

/// Reads unsigned numbers such as "30.000000". The quotient of two numbers that a `float` holds exactly is rounded
/// once, as the general conversion does. False if the text needs that one.
bool readShortDecimal(std::string_view text, float& value)
{
    static constexpr float powers[] = {1e0F, 1e1F, 1e2F, 1e3F, 1e4F, 1e5F, 1e6F, 1e7F, 1e8F, 1e9F, 1e10F};
    constexpr std::size_t mostCharacters = 19; // the digits of so many characters fit 64 bits
    constexpr std::uint64_t largestExact = 1 << std::numeric_limits<float>::digits;
    if (text.size() > mostCharacters)
        return false;
    std::uint64_t digits = 0;
    std::size_t point = text.size();
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (isDigit(text[i]))
            digits = digits * 10 + static_cast<std::uint64_t>(text[i] - '0');
        else if (text[i] == '.' && point == text.size())
            point = i;
        else
            return false;
    }
    std::size_t decimals = point == text.size() ? 0 : text.size() - point - 1;
    for (; digits > largestExact && decimals > 0 && digits % 10 == 0; --decimals)
        digits /= 10;
    if (digits > largestExact || decimals >= std::size(powers))
        return false;
    value = static_cast<float>(digits) / powers[decimals];
    return true;
}

} // namespace

std::string_view withoutLeadingBlanks(std::string_view text)
{
    while (!text.empty() && (text[0] == ' ' || (text[0] >= '\t' && text[0] <= '\r')))
        text.remove_prefix(1);
    return text;
}

std::int64_t integerOf(std::string_view text)
{
    text = withoutLeadingBlanks(text);
    const bool isMinus = takeSign(text);
    if (text.empty() || !isDigit(text[0]))
        return 0;
    std::uint64_t value = 0;
    const std::uint64_t limit = std::uint64_t{std::numeric_limits<std::int64_t>::max()} + (isMinus ? 1 : 0);
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error != std::errc() || value > limit)
        value = limit;
    return static_cast<std::int64_t>(isMinus ? 0 - value : value);
}

std::int32_t integer32Of(std::string_view text)
{
    using Limits = std::numeric_limits<std::int32_t>;
    const std::int64_t value = integerOf(text);
    if (value < Limits::min())
        return Limits::min();
    return value > Limits::max() ? Limits::max() : static_cast<std::int32_t>(value);
}

float floatOf(std::string_view text)
{
    text = withoutLeadingBlanks(text);
    const bool isMinus = takeSign(text);
    // "inf" and "nan" are no decimal numbers.
    if (text.empty() || !(isDigit(text[0]) || text[0] == '.'))
        return 0;
    float value = 0;
    if (readShortDecimal(text, value))
        return isMinus ? -value : value;
    if (std::from_chars(text.data(), text.data() + text.size(), value).ec == std::errc::result_out_of_range)
        value = outOfRange(text);
    return isMinus ? -value : value;
}

bool booleanOf(std::string_view text)
{
    if (text.empty())
        return false;
    const char c = text[0];
    return c == 'y' || c == 'Y' || c == 't' || c == 'T' || (c >= '1' && c <= '9');
}

int gainUnitOf(std::string_view text)
{
    return text == "dB" ? 1 : 0;
}

std::string hexText(std::uint32_t value)
{
    char text[16];
    std::snprintf(text, sizeof text, "%04X", value);
    return text;
}

std::string fixedText(float value)
{
    char text[64];
    return {text, std::to_chars(text, text + sizeof text, double{value}, std::chars_format::fixed, 6).ptr};
}

std::string shortText(float value)
{
    char text[64];
    return {text, std::to_chars(text, text + sizeof text, value).ptr};
}

std::string booleanText(bool value)
{
    return value ? "YES" : "NO";
}

std::string orNull(const std::optional<std::string>& text)
{
    return text.value_or("(null)");
}

std::string addressText(const void* object)
{
    char text[32];
    std::snprintf(text, sizeof text, "%p", object);
    return text;
}

} // namespace adm
