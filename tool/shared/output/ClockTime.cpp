#include "tool/shared/output/ClockTime.h"

#include "platform/core/DateText.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <string_view>

std::string clockText(double seconds, int decimals, ShowHours showHours)
{
    const auto unitsPerSecond = static_cast<std::int64_t>(std::llround(std::pow(10.0, decimals)));
    const auto units =
        static_cast<std::int64_t>(std::llround(std::min(seconds * static_cast<double>(unitsPerSecond), 9e18)));
    const std::int64_t minutes = units / unitsPerSecond / 60;
    const std::int64_t rest = units - minutes * 60 * unitsPerSecond;
    const bool hours = minutes >= 60 || showHours == ShowHours::always;
    std::string text = hours ? fmt::format("{}:{:02}", minutes / 60, minutes % 60) : fmt::format("{}", minutes);
    text += fmt::format(":{:02}", rest / unitsPerSecond);
    return decimals == 0 ? text : text + fmt::format(".{:0{}}", rest % unitsPerSecond, decimals);
}

std::string durationText(double seconds)
{
    return clockText(std::min(seconds, 1e15), 3);
}

std::optional<double> timeFromText(const std::string& text)
{
    constexpr double kMostSeconds = 1e9;
    double seconds = 0;
    std::string_view rest = text;
    for (int colons = 0;; ++colons) {
        const std::size_t colon = rest.find(':');
        const std::string_view part = rest.substr(0, colon);
        const bool last = colon == std::string_view::npos;
        double value = 0;
        const auto [end, error] =
            std::from_chars(part.data(), part.data() + part.size(), value, std::chars_format::fixed);
        if (error != std::errc() || end != part.data() + part.size() || !(value >= 0) || colons > 2 ||
            (!last && value != std::floor(value)) || (colons > 0 && value >= 60))
            return std::nullopt;
        seconds = seconds * 60 + value;
        if (last)
            return seconds <= kMostSeconds ? std::optional(seconds) : std::nullopt;
        rest.remove_prefix(colon + 1);
    }
}

std::uint64_t SoundLength::at(double sampleRate) const
{
    return seconds ? static_cast<std::uint64_t>(std::min(std::round(*seconds * sampleRate), 9e18)) : frames;
}

std::optional<SoundLength> soundLengthFromText(const std::string& text)
{
    const bool hasUnit = text.ends_with('s');
    SoundLength length;
    if (hasUnit || text.find(':') != std::string::npos) {
        length.seconds = timeFromText(text.substr(0, text.size() - (hasUnit ? 1 : 0)));
        return length.seconds ? std::optional(length) : std::nullopt;
    }
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, length.frames);
    return error == std::errc() && rest == end ? std::optional(length) : std::nullopt;
}

std::string dateText(const std::optional<platform::Date>& date)
{
    return date ? platform::dateText(*date) : "";
}

std::string localDateText(const std::optional<platform::Date>& date)
{
    return date ? platform::localDateText(*date) : "";
}
