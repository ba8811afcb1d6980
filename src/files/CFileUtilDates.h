// The dates of files, in seconds since 2001-01-01 00:00:00 UTC, the epoch of property lists, or in the form of old
// catalogs, seconds since 1904-01-01 00:00:00 in local time. Symbolic links are followed.
#pragma once

#include "files/CFileRef.h"

#include <cstdint>

/// When the content was modified, in seconds since 2001, with fractions; 0 on failure.
KT_EXPORT double CFileUtilUTCModDate(const CFileRef& file);
/// Sets that date: 0 or a status; kStatusParameterError for a number that is no date.
KT_EXPORT short CFileUtilSetUTCModDate(const CFileRef& file, double seconds);
/// When the content was modified, in the form of old catalogs: whole seconds, the low 32 bits; 0 on failure. Kept:
/// local time is UTC plus today's offset, so that files of the other half of the year come out an hour off where
/// there is daylight saving.
KT_EXPORT unsigned int CFileUtilModDate(const CFileRef& file);
/// Sets that date: 0, or kStatusIOError whatever the reason.
KT_EXPORT short CFileUtilSetModDate(const CFileRef& file, unsigned int legacySeconds);

/// When the content was modified; null on failure.
KT_EXPORT std::optional<platform::Date> CFileUtilGetModificationDate(const CFileRef& file);
/// When the file was created; null when the file system does not keep that date.
KT_EXPORT std::optional<platform::Date> CFileUtilGetCreationDate(const CFileRef& file);
/// Sets the date of modification: 0 or a status.
KT_EXPORT std::int32_t CFileUtilSetModificationDate(const CFileRef& file, platform::Date date);
/// Always fails, with kStatusIOError for an existing item: this system has no call for it.
KT_EXPORT std::int32_t CFileUtilSetCreationDate(const CFileRef& file, platform::Date date);

/// Sets the dates of modification and last access to now: 0 or a status.
KT_EXPORT short CFileUtilBumpDate(const CFileRef& file);
