#include "tool/meta/MetaValues.h"

#include "audiofile/metadata/CommentList.h"
#include "platform/String.h"
#include "platform/core/ASCIICase.h"
#include "platform/core/FourCC.h"
#include "tool/shared/arguments/UsageError.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <cmath>
#include <limits>
#include <optional>
#include <span>

namespace {

[[noreturn]] void refuse(const std::string& text)
{
    throw UsageError(text);
}

struct PictureRate {
    std::string_view text;
    std::int64_t perSecond;              // as a time code counts
    std::int64_t numerator, denominator; // length of a picture in seconds
};
constexpr PictureRate kPictureRates[] = {
    {"24", 24, 1, 24},          {"25", 25, 1, 25},          {"30", 30, 1, 30},           {"48", 48, 1, 48},
    {"50", 50, 1, 50},          {"60", 60, 1, 60},          {"23.976", 24, 1001, 24000}, {"23.98", 24, 1001, 24000},
    {"29.97", 30, 1001, 30000}, {"59.94", 60, 1001, 60000},
};

template <class Number>
std::optional<Number> numberFrom(std::string_view text)
{
    Number number = 0;
    if (text.starts_with('+'))
        text.remove_prefix(1);
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

/// Takes numbers with the given `digits`, separated by one of `separators`.
bool takeNumbers(std::string_view text, std::span<int> numbers, std::span<const int> digits,
                 std::string_view separators)
{
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        const auto count = static_cast<std::size_t>(digits[i]);
        const bool isLast = i + 1 == numbers.size();
        if (text.size() < count ||
            (isLast ? text.size() != count : separators.find(text[count]) == std::string_view::npos))
            return false;
        for (const char c : text.substr(0, count)) {
            if (c < '0' || c > '9')
                return false;
            numbers[i] = numbers[i] * 10 + (c - '0');
        }
        text.remove_prefix(isLast ? count : count + 1);
    }
    return true;
}

std::int64_t picturesOf(const std::string& text, std::string_view code, const PictureRate& rate)
{
    std::array<int, 4> parts{};
    constexpr std::array digits{2, 2, 2, 2};
    if (!takeNumbers(code, parts, digits, ":;") || parts[1] > 59 || parts[2] > 59 || parts[3] >= rate.perSecond)
        refuse("a time code such as 01:00:00:00@25 expected");
    const bool dropsPictures = code[8] == ';';
    const std::int64_t minute = parts[0] * 60 + parts[1];
    const std::int64_t dropped = rate.perSecond / 15; // every minute except each tenth
    if (dropsPictures && (rate.numerator == 1 || rate.perSecond % 30 != 0))
        refuse(fmt::format("{}: only 29.97 and 59.94 pictures a second have drop-frame codes", text));
    if (dropsPictures && parts[1] % 10 != 0 && parts[2] == 0 && parts[3] < dropped)
        refuse(fmt::format("{}: there is no such drop-frame code", text));
    return (minute * 60 + parts[2]) * rate.perSecond + parts[3] -
           (dropsPictures ? dropped * (minute - minute / 10) : 0);
}

bool isASCII(std::string_view text, bool takesLines)
{
    return std::ranges::all_of(
        text, [=](char c) { return (c >= 0x20 && c < 0x7F) || (takesLines && (c == '\r' || c == '\n' || c == '\t')); });
}

MetaValue textValue(const std::string& text, std::size_t most)
{
    if (!platform::String::fromUTF8(text) || text.find('\0') != std::string::npos)
        refuse("UTF-8 text without NUL expected");
    if (text.size() > most)
        refuse(fmt::format("at most {} bytes fit, these are {}", most, text.size()));
    return text;
}

MetaValue asciiValue(const std::string& text, std::size_t most, bool takesLines, bool isLenient)
{
    if (!isASCII(text, takesLines) && !isLenient)
        refuse(takesLines ? "ASCII text expected; --lenient writes UTF-8"
                          : "ASCII text on one line expected; --lenient writes UTF-8");
    return textValue(text, most);
}

MetaValue dateValue(const std::string& text, bool isLenient)
{
    using namespace std::chrono;
    std::array<int, 3> parts{};
    constexpr std::array digits{4, 2, 2};
    const bool isDate =
        takeNumbers(text, parts, digits, "-_: .") &&
        year_month_day(year(parts[0]), month(static_cast<unsigned>(parts[1])), day(static_cast<unsigned>(parts[2])))
            .ok();
    if (!isDate && !isLenient)
        refuse("a date of the calendar such as 2026-11-22 expected; --lenient writes others");
    return textValue(text, 10);
}

MetaValue clockValue(const std::string& text, bool isLenient)
{
    std::array<int, 3> parts{};
    constexpr std::array digits{2, 2, 2};
    if (!(takeNumbers(text, parts, digits, "-_: .") && parts[0] < 24 && parts[1] < 60 && parts[2] < 60) && !isLenient)
        refuse("a time such as 10:44:00 expected; --lenient writes others");
    return textValue(text, 8);
}

Bytes hexValue(std::string_view text, const char* expected)
{
    if (text.starts_with("0x") || text.starts_with("0X"))
        text.remove_prefix(2);
    Bytes bytes;
    for (std::size_t i = 0; i < text.size(); i += 2) {
        unsigned byte = 0;
        const char* const end = text.data() + std::min(i + 2, text.size());
        const auto read = std::from_chars(text.data() + i, end, byte, 16);
        if (read.ec != std::errc() || read.ptr != text.data() + i + 2)
            refuse(fmt::format("{} in hexadecimal expected, these are {} characters", expected, text.size()));
        bytes.push_back(static_cast<std::byte>(byte));
    }
    return bytes;
}

/// A digest as written in RFC 1321.
MetaValue digestValue(std::string_view text)
{
    constexpr std::size_t size = 16;
    Bytes digest = hexValue(text, "16 bytes");
    if (digest.size() != size)
        refuse(fmt::format("16 bytes in hexadecimal expected, these are {} digits", text.size()));
    return digest;
}

/// SMPTE ST 330: a label that begins with 06 0a 2b 34, and the size of the rest in its 13th byte.
MetaValue umidValue(std::string_view text, bool isLenient)
{
    constexpr std::size_t basic = 32, extended = 64;
    const Bytes umid = hexValue(text, "32 or 64 bytes");
    if (umid.size() != basic && umid.size() != extended)
        refuse(fmt::format("32 or 64 bytes in hexadecimal expected, these are {} digits", text.size()));
    constexpr std::array label{std::byte{0x06}, std::byte{0x0A}, std::byte{0x2B}, std::byte{0x34}};
    const std::byte rest = umid[12];
    const bool isLabelled = std::ranges::equal(BytesView(umid).first(label.size()), label) &&
                            (rest == std::byte{0x33} || (rest == std::byte{0x13} && umid.size() == basic));
    if (!isLabelled && !isLenient)
        refuse("a UMID begins with 060a2b34, and its 13th byte is 13, or of 64 bytes 33; --lenient writes others");
    return umid;
}

MetaValue integerValue(const std::string& text, MetaRange range)
{
    const auto number = numberFrom<std::int64_t>(text);
    if (!number || static_cast<double>(*number) < range.least || static_cast<double>(*number) > range.most)
        refuse(fmt::format("a whole number from {:.0f} to {:.0f} expected", range.least, range.most));
    return *number;
}

MetaValue decimalValue(const std::string& text, MetaRange range)
{
    const auto number = numberFrom<double>(text);
    if (!number || !(*number >= range.least && *number <= range.most))
        refuse(fmt::format("a number from {} to {} expected", range.least, range.most));
    return *number;
}

MetaValue idValue(const std::string& text)
{
    if (text.size() != sizeof(FourCC) || !isASCII(text, false))
        refuse("four ASCII characters expected");
    return std::int64_t{fourCC(text[0], text[1], text[2], text[3])};
}

MetaValue loopTypeValue(const std::string& text)
{
    constexpr std::array<std::string_view, 3> words{"forward", "alternating", "backward"};
    for (std::size_t i = 0; i < words.size(); ++i)
        if (equalIgnoringASCIICase(words[i], text))
            return static_cast<std::int64_t>(i);
    const auto number = numberFrom<std::uint32_t>(text);
    if (!number)
        refuse("forward, alternating, backward or a whole number expected");
    return std::int64_t{*number};
}

MetaValue smpteOffsetValue(const std::string& text)
{
    std::array<int, 4> parts{};
    constexpr std::array digits{2, 2, 2, 2};
    const bool isNegative = text.starts_with('-');
    if (!takeNumbers(std::string_view(text).substr(isNegative ? 1 : 0), parts, digits, ":") || parts[0] > 23 ||
        parts[1] > 59 || parts[2] > 59 || parts[3] > 29)
        refuse("hh:mm:ss:ff expected, such as 01:00:00:00, from -23 to 23 hours");
    const auto hours = static_cast<std::uint8_t>(isNegative ? -parts[0] : parts[0]);
    return static_cast<std::int64_t>(std::uint32_t{hours} << 24 | static_cast<std::uint32_t>(parts[1]) << 16 |
                                     static_cast<std::uint32_t>(parts[2]) << 8 | static_cast<std::uint32_t>(parts[3]));
}

/// "2024-01-01T00:00:00Z", or seconds since 1904.
MetaValue momentValue(const std::string& text)
{
    using namespace std::chrono;
    if (const auto seconds = numberFrom<std::uint32_t>(text))
        return std::int64_t{*seconds};
    std::array<int, 6> parts{};
    constexpr std::array digits{4, 2, 2, 2, 2, 2};
    const std::string_view date = std::string_view(text).substr(0, text.size() - (text.ends_with('Z') ? 1 : 0));
    if (takeNumbers(date, parts, digits, "-T:")) {
        const year_month_day day(year(parts[0]), month(static_cast<unsigned>(parts[1])),
                                 std::chrono::day(static_cast<unsigned>(parts[2])));
        const std::int64_t seconds = day.ok() ? sys_days(day).time_since_epoch().count() * 86400 + parts[3] * 3600 +
                                                    parts[4] * 60 + parts[5] + AIFFComment::kSecondsTo1970
                                              : -1;
        if (seconds >= 0 && seconds <= std::numeric_limits<std::uint32_t>::max() && parts[3] < 24 && parts[4] < 60 &&
            parts[5] < 60)
            return seconds;
    }
    refuse("a date such as 2024-01-31T12:00:00Z, from 1904 to 2040, or seconds since 1904 expected");
}

} // namespace

std::uint64_t MetaTime::at(double sampleRate) const
{
    if (pictures < 0)
        return length.at(sampleRate);
    // Integers keep an hour at 29.97 pictures per second exact.
    const long double frames = static_cast<long double>(pictures) * static_cast<long double>(numerator) *
                               static_cast<long double>(sampleRate) / static_cast<long double>(denominator);
    return static_cast<std::uint64_t>(std::roundl(frames));
}

MetaTime metaTimeFromText(const std::string& text)
{
    MetaTime time;
    const std::size_t at = text.find('@');
    if (at == std::string::npos) {
        if (std::ranges::count_if(text, [](char c) { return c == ':' || c == ';'; }) == 3)
            refuse("a time code needs its pictures a second, as in 01:00:00:00@25");
        const auto length = soundLengthFromText(text);
        if (!length)
            refuse("frames such as 48000, a time such as 1:02:03.5 or a time code such as 01:00:00:00@25 expected");
        time.length = *length;
        return time;
    }
    const auto rate = std::ranges::find(kPictureRates, std::string_view(text).substr(at + 1), &PictureRate::text);
    if (rate == std::end(kPictureRates))
        refuse("pictures a second are 24, 25, 30, 48, 50, 60, 23.976, 29.97 or 59.94");
    time.pictures = picturesOf(text, std::string_view(text).substr(0, at), *rate);
    time.numerator = rate->numerator;
    time.denominator = rate->denominator;
    return time;
}

MetaValue metaValueFromText(MetaKind kind, MetaRange range, const std::string& text, bool isLenient)
{
    const auto most = static_cast<std::size_t>(std::max(range.most, 0.0));
    switch (kind) {
    case MetaKind::none:
        refuse("cannot be set, only removed");
    case MetaKind::text:
        return textValue(text, most);
    case MetaKind::line:
        return asciiValue(text, most, false, isLenient);
    case MetaKind::ascii:
        return asciiValue(text, most, true, isLenient);
    case MetaKind::date:
        return dateValue(text, isLenient);
    case MetaKind::clock:
        return clockValue(text, isLenient);
    case MetaKind::umid:
        return umidValue(text, isLenient);
    case MetaKind::digest:
        return digestValue(text);
    case MetaKind::time:
        return metaTimeFromText(text);
    case MetaKind::integer:
        return integerValue(text, range);
    case MetaKind::decimal:
        return decimalValue(text, range);
    case MetaKind::id:
        return idValue(text);
    case MetaKind::loopType:
        return loopTypeValue(text);
    case MetaKind::smpteOffset:
        return smpteOffsetValue(text);
    case MetaKind::moment:
        return momentValue(text);
    }
    return {};
}
