#include "adm/ADMTimestamp.h"

#include "adm/ADMText.h"

#include <algorithm>
#include <charconv>
#include <cstdio>

namespace {

constexpr std::int64_t kSecond = 1000000;
constexpr std::int64_t kMinute = 60 * kSecond;
constexpr std::int64_t kHour = 60 * kMinute;
constexpr std::size_t kMostDecimals = 38;   // 10^38 fits 128 bits
constexpr std::int64_t kFractions = 100000; // per second, unless the text says otherwise

struct Timestamp {
    std::int64_t hours = 0, minutes = 0, seconds = 0, fraction = 0;
    std::size_t fractionDigits = 0;
    std::int64_t fractionsPerSecond = kFractions;
    bool isSampleBased = false;
};

/// Takes integers and separators off the front of a text.
class Scanner {
public:
    explicit Scanner(std::string_view text) : text_(text) {}

    /// Reads a signed 64-bit integer with optional blanks ahead of it.
    bool integer(std::int64_t& value)
    {
        text_ = adm::withoutLeadingBlanks(text_);
        if (text_.size() > 1 && text_[0] == '+' && text_[1] != '-')
            text_.remove_prefix(1);
        const auto [end, error] = std::from_chars(text_.data(), text_.data() + text_.size(), value);
        if (error != std::errc())
            return false;
        digits_ = static_cast<std::size_t>(end - text_.data()) - (text_[0] == '-' ? 1 : 0);
        text_.remove_prefix(static_cast<std::size_t>(end - text_.data()));
        return true;
    }
    bool separator(char c)
    {
        const bool found = !text_.empty() && text_[0] == c;
        if (found)
            text_.remove_prefix(1);
        return found;
    }
    /// Digits of the integer that was read last.
    std::size_t digits() const { return digits_; }

private:
    std::string_view text_;
    std::size_t digits_ = 0;
};

bool scan(std::string_view text, Timestamp& time)
{
    Scanner scanner(text);
    if (!scanner.integer(time.hours) || !scanner.separator(':') || !scanner.integer(time.minutes) ||
        !scanner.separator(':') || !scanner.integer(time.seconds) || !scanner.separator('.') ||
        !scanner.integer(time.fraction))
        return false;
    time.fractionDigits = scanner.digits();
    time.isSampleBased = scanner.separator('S');
    return !time.isSampleBased || (scanner.integer(time.fractionsPerSecond) && time.fractionsPerSecond != 0);
}

using Wide = __int128; // the sum of four products of 64 bits

std::int64_t microseconds(const Timestamp& time, Wide fractionsPerSecond)
{
    const Wide sum = Wide{time.hours} * kHour + Wide{time.minutes} * kMinute + Wide{time.seconds} * kSecond +
                     Wide{time.fraction} * kSecond / fractionsPerSecond;
    const auto narrow = static_cast<std::int64_t>(sum);
    return narrow == sum ? narrow : kADMInvalidTime;
}

/// Reads "hh:mm:ss.zzzzz", the form of nearly all documents; negative if the text differs from it in any way.
std::int64_t usualMicroseconds(std::string_view text)
{
    constexpr std::string_view form = "00:00:00.00000";
    if (text.size() != form.size())
        return -1;
    // Weight of each digit; separators weigh nothing.
    static constexpr std::int64_t worth[form.size()] = {
        10 * kHour, kHour, 0, 10 * kMinute, kMinute, 0, 10 * kSecond, kSecond, 0, 100000, 10000, 1000, 100, 10};
    std::int64_t time = 0;
    bool isUsual = true;
    for (std::size_t i = 0; i < form.size(); ++i) {
        const int digit = text[i] - form[i];
        isUsual &= digit >= 0 && digit <= (worth[i] == 0 ? 0 : 9);
        time += digit * worth[i];
    }
    return isUsual ? time : -1;
}

} // namespace

std::int64_t ADMTimestampStringToMicroSeconds(std::optional<std::string_view> text)
{
    if (const std::int64_t usual = text ? usualMicroseconds(*text) : kADMInvalidTime; usual >= 0)
        return usual;
    Timestamp time;
    return text && scan(*text, time) ? microseconds(time, time.fractionsPerSecond) : kADMInvalidTime;
}

std::int64_t ADMTimestampStringToExactMicroSeconds(std::optional<std::string_view> text)
{
    Timestamp time;
    if (!text || !scan(*text, time))
        return kADMInvalidTime;
    if (time.isSampleBased)
        return microseconds(time, time.fractionsPerSecond);
    Wide decimals = 1;
    // Beyond 10^38 the leading digits of the fraction are zeros, so less than a microsecond remains.
    for (std::size_t i = 0; i < std::min(time.fractionDigits, kMostDecimals); ++i)
        decimals *= 10;
    return microseconds(time, decimals);
}

std::string ADMTimeMicrosecToTimestampString(std::int64_t microseconds)
{
    const std::int64_t hours = microseconds / kHour;
    const std::int64_t belowHour = microseconds - hours * kHour;
    const std::int64_t minutes = belowHour / kMinute;
    const std::int64_t belowMinute = belowHour - minutes * kMinute;
    const std::int64_t seconds = belowMinute / kSecond;
    char fraction[32];
    std::snprintf(fraction, sizeof fraction, "%05lld",
                  static_cast<long long>((belowMinute - seconds * kSecond + 5) / 10));
    char text[96];
    // Kept: the fraction is cut to five characters, so 99999.5 and above read as "10000".
    std::snprintf(text, sizeof text, "%02lld:%02lld:%02lld.%.5s", static_cast<long long>(hours),
                  static_cast<long long>(minutes), static_cast<long long>(seconds), fraction);
    return text;
}
