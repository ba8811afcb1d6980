#include "platform/core/DateText.h"

#include <cmath>
#include <ctime>

namespace platform {

namespace {

template <class Convert>
std::string calendarText(Date date, const char* format, Convert convert)
{
    constexpr double kUnixTimeOf2001 = 978'307'200, kFarthest = 1e12;
    if (!(std::abs(date.secondsSince2001) < kFarthest))
        return "";
    std::tm parts = {};
    char text[32];
    const auto seconds = static_cast<std::time_t>(std::floor(date.secondsSince2001 + kUnixTimeOf2001));
    const bool isKnown = convert(&seconds, &parts) != nullptr;
    return isKnown ? std::string(text, std::strftime(text, sizeof text, format, &parts)) : "";
}

} // namespace

std::string dateText(Date date)
{
    return calendarText(date, "%Y-%m-%dT%H:%M:%SZ", ::gmtime_r);
}

std::string localDateText(Date date)
{
    return calendarText(date, "%Y-%m-%d %H:%M", ::localtime_r);
}

} // namespace platform
