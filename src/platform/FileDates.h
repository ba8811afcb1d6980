// The dates that the file system keeps of an item, and the local time zone.
#pragma once

#include "platform/core/Export.h"

#include <cstdint>
#include <optional>

namespace platform {

/// A point in time: since 1970-01-01 00:00:00 UTC, the nanoseconds counted forwards, also before that.
struct FileTime {
    std::int64_t seconds = 0;
    std::uint32_t nanoseconds = 0;
    friend bool operator==(const FileTime&, const FileTime&) = default;
};

enum class FileDate { modification, creation };

// Symbolic links are followed. On failure errno says why.

/// Null, with EOPNOTSUPP, also where the file system does not keep the date.
KT_EXPORT std::optional<FileTime> fileDate(const char* path, FileDate date);
/// Leaves the date of the last access as it is. EOPNOTSUPP for the creation date, which no call of this system sets.
KT_EXPORT bool setFileDate(const char* path, FileDate date, const FileTime& time);
/// Sets the dates of modification and of the last access to now.
KT_EXPORT bool touchFile(const char* path);

/// By how many seconds local time is ahead of UTC at a point in time (seconds since 1970), daylight saving included.
KT_EXPORT std::int64_t localOffsetFromUTC(std::int64_t time);
/// Seconds since 1970.
KT_EXPORT std::int64_t currentTime();

} // namespace platform
