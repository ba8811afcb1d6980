// The dates that the file system keeps of an item, and the local time zone.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <optional>

namespace platform {

/// A point in time since 1970-01-01 00:00:00 UTC; nanoseconds count forwards, before 1970 too.
struct FileTime {
    std::int64_t seconds = 0;      // negative before 1970
    std::uint32_t nanoseconds = 0; // 0 to 999,999,999
    friend bool operator==(const FileTime&, const FileTime&) = default;
};

/// Which date of an item.
enum class FileDate { modification, creation };

// Symbolic links are followed. On failure errno says why.

/// A date of the item at a path; null, with errno, on failure. EOPNOTSUPP: the file system does not keep the date.
KT_EXPORT std::optional<FileTime> fileDate(const char* path, FileDate date);
/// Sets a date and leaves the date of the last access alone. False, with errno, on failure. EOPNOTSUPP for the
/// creation date, which no call of this system sets.
KT_EXPORT bool setFileDate(const char* path, FileDate date, const FileTime& time);
/// Sets the dates of modification and last access to now. False, with errno, on failure.
KT_EXPORT bool touchFile(const char* path);

/// How many seconds local time is ahead of UTC at a time (seconds since 1970), daylight saving included.
KT_EXPORT std::int64_t localOffsetFromUTC(std::int64_t time);
/// Now, in seconds since 1970.
KT_EXPORT std::int64_t currentTime();

} // namespace platform
