#include "platform/FileDates.h"

#include <cerrno>
#include <ctime>

#include <fcntl.h>
#include <sys/stat.h>

namespace platform {

namespace {

FileTime fileTime(const statx_timestamp& from)
{
    return {from.tv_sec, from.tv_nsec};
}

} // namespace

std::optional<FileTime> fileDate(const char* path, FileDate date)
{
    const unsigned wanted = date == FileDate::creation ? STATX_BTIME : STATX_MTIME;
    struct statx found = {};
    if (statx(AT_FDCWD, path, AT_NO_AUTOMOUNT, wanted, &found) != 0)
        return std::nullopt;
    if ((found.stx_mask & wanted) == 0) {
        errno = EOPNOTSUPP;
        return std::nullopt;
    }
    return fileTime(date == FileDate::creation ? found.stx_btime : found.stx_mtime);
}

bool setFileDate(const char* path, FileDate date, const FileTime& time)
{
    if (date == FileDate::creation) {
        if (fileDate(path, FileDate::modification)) // otherwise fileDate has set a better error
            errno = EOPNOTSUPP;
        return false;
    }
    timespec times[2] = {};
    times[0].tv_nsec = UTIME_OMIT;
    times[1].tv_sec = time.seconds;
    times[1].tv_nsec = time.nanoseconds;
    return utimensat(AT_FDCWD, path, times, 0) == 0;
}

bool touchFile(const char* path)
{
    return utimensat(AT_FDCWD, path, nullptr, 0) == 0;
}

std::int64_t localOffsetFromUTC(std::int64_t time)
{
    tzset(); // afterwards localtime_r need not check whether the zone changed
    const std::time_t seconds = time;
    std::tm local = {};
    return localtime_r(&seconds, &local) != nullptr ? local.tm_gmtoff : 0;
}

std::int64_t currentTime()
{
    return std::time(nullptr);
}

} // namespace platform
