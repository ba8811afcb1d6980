// The dates of files: by the epoch of property lists (2001-01-01 00:00:00 UTC), and in the form of old catalogs,
// seconds since 1904-01-01 00:00:00 in local time. A symbolic link stands for its target.
#pragma once

#include "files/CFileRef.h"

#include <cstdint>

/// When the content was modified, in seconds since 2001, with fractions; 0 when it cannot be had.
KT_EXPORT double CFileUtilUTCModDate(const CFileRef& file);
/// 0 or an error; kStatusParameterError for what is no date.
KT_EXPORT short CFileUtilSetUTCModDate(const CFileRef& file, double seconds);
/// The same in the form of old catalogs: whole seconds, the low 32 bits. 0 when it cannot be had.
/// Kept: local time is UTC shifted by the zone's offset of today, so that files of the other half of the year come out
/// an hour off where there is daylight saving.
KT_EXPORT unsigned int CFileUtilModDate(const CFileRef& file);
/// The inverse. 0, or kStatusIOError whatever the reason.
KT_EXPORT short CFileUtilSetModDate(const CFileRef& file, unsigned int legacySeconds);

/// The dates as values. Null when there is none: file systems need not keep that of creation.
KT_EXPORT std::optional<platform::Date> CFileUtilGetModificationDate(const CFileRef& file);
KT_EXPORT std::optional<platform::Date> CFileUtilGetCreationDate(const CFileRef& file);
KT_EXPORT std::int32_t CFileUtilSetModificationDate(const CFileRef& file, platform::Date date);
/// kStatusIOError for an item that is there: this system has no call for it.
KT_EXPORT std::int32_t CFileUtilSetCreationDate(const CFileRef& file, platform::Date date);

/// Sets the dates of modification and of the last access to now.
KT_EXPORT short CFileUtilBumpDate(const CFileRef& file);
