#include "files/CFileUtilDates.h"

#include "platform/FileDates.h"
#include "platform/core/Status.h"

#include <chrono>
#include <cmath>

using platform::FileDate;
using platform::FileTime;

namespace {

constexpr std::int64_t secondsFrom1970To(std::chrono::year_month_day day)
{
    return std::chrono::duration_cast<std::chrono::seconds>(std::chrono::sys_days(day).time_since_epoch()).count();
}

using namespace std::chrono_literals;
constexpr std::int64_t k1904 = secondsFrom1970To(1904y / std::chrono::January / 1);
constexpr std::int64_t k2001 = secondsFrom1970To(2001y / std::chrono::January / 1);
static_assert(k1904 == -2'082'844'800 && k2001 == 978'307'200);

constexpr double kNanosecondsPerSecond = 1e9;

std::optional<FileTime> dateOf(const CFileRef& file, FileDate date)
{
    const char* path = file.GetPath();
    return path != nullptr ? platform::fileDate(path, date) : std::nullopt;
}

double secondsSince2001(const FileTime& time)
{
    return static_cast<double>(time.seconds - k2001) + time.nanoseconds / kNanosecondsPerSecond;
}

std::optional<platform::Date> valueOf(const std::optional<FileTime>& time)
{
    return time ? std::optional(platform::Date{secondsSince2001(*time)}) : std::nullopt;
}

std::int32_t setDate(const CFileRef& file, FileDate date, double seconds)
{
    constexpr double farthest = 1e15; // 30 million years; a larger value, or a NaN, is no date
    const char* path = file.GetPath();
    if (path == nullptr || !(std::abs(seconds) <= farthest))
        return kStatusParameterError;
    const double whole = std::floor(seconds);
    FileTime time{static_cast<std::int64_t>(whole) + k2001,
                  static_cast<std::uint32_t>(std::lround((seconds - whole) * kNanosecondsPerSecond))};
    if (time.nanoseconds == kNanosecondsPerSecond)
        time = {time.seconds + 1, 0};
    return platform::setFileDate(path, date, time) ? kStatusOK : PosixErrorToOSErr();
}

std::int64_t localOffset()
{
    return platform::localOffsetFromUTC(platform::currentTime());
}

} // namespace

double CFileUtilUTCModDate(const CFileRef& file)
{
    const auto time = dateOf(file, FileDate::modification);
    return time ? secondsSince2001(*time) : 0;
}

short CFileUtilSetUTCModDate(const CFileRef& file, double seconds)
{
    return static_cast<short>(setDate(file, FileDate::modification, seconds));
}

unsigned int CFileUtilModDate(const CFileRef& file)
{
    const auto time = dateOf(file, FileDate::modification);
    return time ? static_cast<unsigned int>(time->seconds + localOffset() - k1904) : 0;
}

short CFileUtilSetModDate(const CFileRef& file, unsigned int legacySeconds)
{
    const char* path = file.GetPath();
    const FileTime time{k1904 + legacySeconds - localOffset(), 0};
    const bool isSet = path != nullptr && platform::setFileDate(path, FileDate::modification, time);
    return static_cast<short>(isSet ? kStatusOK : kStatusIOError);
}

std::optional<platform::Date> CFileUtilGetModificationDate(const CFileRef& file)
{
    return valueOf(dateOf(file, FileDate::modification));
}

std::optional<platform::Date> CFileUtilGetCreationDate(const CFileRef& file)
{
    return valueOf(dateOf(file, FileDate::creation));
}

std::int32_t CFileUtilSetModificationDate(const CFileRef& file, platform::Date date)
{
    return setDate(file, FileDate::modification, date.secondsSince2001);
}

std::int32_t CFileUtilSetCreationDate(const CFileRef& file, platform::Date date)
{
    return setDate(file, FileDate::creation, date.secondsSince2001);
}

short CFileUtilBumpDate(const CFileRef& file)
{
    const char* path = file.GetPath();
    if (path == nullptr)
        return static_cast<short>(kStatusParameterError);
    return static_cast<short>(platform::touchFile(path) ? kStatusOK : PosixErrorToOSErr());
}
