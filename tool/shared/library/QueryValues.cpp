#include "tool/shared/library/QueryValues.h"

#include "platform/core/ASCIICase.h"
#include "tool/shared/library/KeyText.h"
#include "tool/shared/output/ClockTime.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <ctime>
#include <iterator>

namespace {

std::string_view withoutPadding(std::string_view text)
{
    const std::size_t start = std::min(text.find_first_not_of(" \t"), text.size());
    return text.substr(start, text.find_last_not_of(" \t") + 1 - start);
}

std::string inSmallLetters(std::string_view text)
{
    std::string result(text);
    std::ranges::transform(result, result.begin(), asciiLower);
    return result;
}

struct Unit {
    std::string_view name;
    double factor;
};

std::optional<double> ifFinite(double number)
{
    return std::isfinite(number) ? std::optional(number) : std::nullopt;
}

// The longest name that ends the text counts.
std::optional<double> numberWithUnit(std::string_view text, std::span<const Unit> units)
{
    const std::string lowered = inSmallLetters(withoutPadding(text));
    for (const Unit& unit : units)
        if (lowered.ends_with(unit.name))
            if (const auto number = plainNumberFromText(
                    withoutPadding(std::string_view(lowered).substr(0, lowered.size() - unit.name.size()))))
                return ifFinite(*number * unit.factor);
    return std::nullopt;
}

std::optional<int> wholeNumber(std::string_view text, int least, int most)
{
    int number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool isWhole = !text.empty() && error == std::errc() && end == text.data() + text.size();
    return isWhole && number >= least && number <= most ? std::optional(number) : std::nullopt;
}

// Takes so many digits, and the separator behind them unless the text ends there.
std::optional<int> takeDigits(std::string_view& text, std::size_t digits, std::string_view separators, int least,
                              int most)
{
    const std::string_view part = text.substr(0, digits);
    if (part.size() != digits || !std::ranges::all_of(part, [](char c) { return c >= '0' && c <= '9'; }))
        return std::nullopt;
    text.remove_prefix(digits);
    if (!text.empty() && text.front() != 'Z') {
        if (separators.find(text.front()) == separators.npos)
            return std::nullopt;
        text.remove_prefix(1);
        if (text.empty())
            return std::nullopt;
    }
    return wholeNumber(part, least, most);
}

std::optional<std::int64_t> nanoseconds(std::tm time, bool isUTC)
{
    constexpr std::int64_t kNanoseconds = 1'000'000'000;
    const std::tm asked = time;
    time.tm_isdst = -1;
    const std::time_t seconds = isUTC ? ::timegm(&time) : std::mktime(&time);
    if (time.tm_mday != asked.tm_mday || time.tm_mon != asked.tm_mon) // the 31st of a month that has 30
        return std::nullopt;
    return static_cast<std::int64_t>(seconds) * kNanoseconds;
}

// "2026-11-01", "2026-11-01T12:30", "2026-11-01 12:30:05Z".
std::optional<std::int64_t> dateFromText(std::string_view text)
{
    std::tm time{};
    const auto take = [&](int& field, std::size_t digits, std::string_view separators, int least, int most, int base) {
        const auto number = takeDigits(text, digits, separators, least, most);
        field = number.value_or(0) - base;
        return number.has_value();
    };
    if (!take(time.tm_year, 4, "-", 1970, 2200, 1900) || !take(time.tm_mon, 2, "-", 1, 12, 1) ||
        !take(time.tm_mday, 2, "T ", 1, 31, 0))
        return std::nullopt;
    if (!text.empty() && text != "Z") {
        if (!take(time.tm_hour, 2, ":", 0, 23, 0) || text.empty() || !take(time.tm_min, 2, ":", 0, 59, 0))
            return std::nullopt;
        if (!text.empty() && text != "Z" && !take(time.tm_sec, 2, "", 0, 59, 0))
            return std::nullopt;
    }
    if (!text.empty() && text != "Z")
        return std::nullopt;
    return nanoseconds(time, text == "Z");
}

// Midnight at the beginning of the day so many days ago, in local time.
std::optional<std::int64_t> daysAgo(int days)
{
    const std::time_t now = std::time(nullptr);
    std::tm day{};
    ::localtime_r(&now, &day);
    std::tm midnight{};
    midnight.tm_year = day.tm_year;
    midnight.tm_mon = day.tm_mon;
    midnight.tm_mday = day.tm_mday - days;
    midnight.tm_isdst = -1;
    return static_cast<std::int64_t>(std::mktime(&midnight)) * 1'000'000'000;
}

} // namespace

std::optional<double> plainNumberFromText(std::string_view text)
{
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, std::chars_format::fixed);
    const bool isNumber = error == std::errc() && end == text.data() + text.size() && std::isfinite(number);
    return isNumber && number >= 0 ? std::optional(number) : std::nullopt;
}

std::optional<double> secondsFromText(std::string_view text)
{
    constexpr Unit kUnits[] = {{"ms", 0.001}, {"min", 60}, {"sec", 1}, {"s", 1}, {"m", 60}, {"h", 3600}};
    const std::string plain(withoutPadding(text));
    if (const auto seconds = timeFromText(plain))
        return seconds;
    return numberWithUnit(plain, kUnits);
}

std::optional<double> rateFromText(std::string_view text)
{
    constexpr Unit kUnits[] = {{"khz", 1000}, {"k", 1000}, {"hz", 1}, {"", 1}};
    const auto rate = numberWithUnit(text, kUnits);
    // 44.1 thousands are whole Hz although their product is not quite.
    return rate ? ifFinite(std::round(*rate * 1000) / 1000) : std::nullopt;
}

std::optional<NumberRange> rangeFromText(std::string_view text, const NumberReader& read)
{
    text = withoutPadding(text);
    const std::size_t dots = text.find("..");
    if (dots == text.npos) {
        const auto number = read(text);
        return number ? std::optional(NumberRange{*number, *number}) : std::nullopt;
    }
    NumberRange range;
    const std::string_view first = withoutPadding(text.substr(0, dots)), last = withoutPadding(text.substr(dots + 2));
    if (!first.empty()) {
        const auto least = read(first);
        if (!least)
            return std::nullopt;
        range.least = *least;
    }
    if (!last.empty()) {
        const auto most = read(last);
        if (!most)
            return std::nullopt;
        range.most = *most;
    }
    const bool isEmpty = first.empty() && last.empty();
    return isEmpty || range.least > range.most ? std::nullopt : std::optional(range);
}

std::optional<NumberRange> tempoFromText(std::string_view text)
{
    constexpr double kTolerance = 0.5;
    auto range = rangeFromText(text, plainNumberFromText);
    if (range && text.find("..") == text.npos) {
        range->least -= kTolerance;
        range->most += kTolerance;
    }
    return range;
}

std::optional<KeyChoice> keyFromText(std::string_view text)
{
    const std::string word = inSmallLetters(withoutPadding(text));
    for (const auto* const mode : {"major", "minor"})
        if (word == mode || word == std::string_view(mode).substr(0, 3))
            return KeyChoice{std::nullopt, mode};
    std::string name(withoutPadding(text));
    if (name.empty())
        return std::nullopt;
    name.front() = asciiLower(name.front()); // a note alone leaves the mode open, large or small
    const auto key = keyOfText(name);
    return key ? std::optional(KeyChoice{key->note, key->mode}) : std::nullopt;
}

std::optional<std::int64_t> sinceFromText(std::string_view text)
{
    constexpr double kDay = 86400, kMostSeconds = 1e10;
    constexpr Unit kAges[] = {{"min", 60},           {"h", 3600},          {"days", kDay},        {"day", kDay},
                              {"d", kDay},           {"weeks", 7 * kDay},  {"week", 7 * kDay},    {"w", 7 * kDay},
                              {"months", 30 * kDay}, {"month", 30 * kDay}, {"years", 365 * kDay}, {"year", 365 * kDay},
                              {"y", 365 * kDay}};
    text = withoutPadding(text);
    if (equalIgnoringASCIICase(text, "today"))
        return daysAgo(0);
    if (equalIgnoringASCIICase(text, "yesterday"))
        return daysAgo(1);
    if (const auto age = numberWithUnit(text, kAges); age && *age <= kMostSeconds)
        return (static_cast<std::int64_t>(std::time(nullptr)) - std::llround(*age)) * 1'000'000'000;
    return dateFromText(text);
}
