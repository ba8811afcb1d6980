// Names that are still free in their folder.
#pragma once

#include "files/CFileRef.h"

#include <cstdint>

/// `path` when nothing is there; else the first free one of "STEM SEPARATOR 1.EXTENSION", 2 and so on (without the
/// spaces, and without the dot where there is no extension). Null when `path` is no path. Another process may take
/// the name before it is used: CFileUtilCreateUniqueFile creates the file at once.
KT_EXPORT platform::String CFileUtilCreateUniqueFileName(const platform::String& path,
                                                         const platform::String& separator);

/// Creates an empty file under the first of these names that is free at that moment, with the given POSIX permissions
/// less the process's mask; no two processes get the same. `created` (may be null) gets its path, null on failure.
/// kStatusParameterError for a path that is not absolute.
KT_EXPORT std::int32_t CFileUtilCreateUniqueFile(const platform::String& path, const platform::String& separator,
                                                 std::uint32_t permissions, platform::String* created);
