// Names that nothing in their folder has yet.
#pragma once

#include "files/CFileRef.h"

#include <cstdint>

/// `path` when nothing is there; else the first of "STEM SEPARATOR 1.EXTENSION", 2 and so on (without the spaces, and
/// without the dot where there is no extension) at which nothing is. Null for a path that is none. Another process may
/// take the name before it is used: CFileUtilCreateUniqueFile creates it at once.
KT_EXPORT platform::String CFileUtilCreateUniqueFileName(const platform::String& path,
                                                         const platform::String& separator);

/// Creates an empty file, with the given POSIX permissions less the process's mask, under the first of these names that
/// is free when it is created; no two processes get the same. `created` (may be null) receives its path, null on
/// failure. kStatusParameterError for a path that is not absolute.
KT_EXPORT std::int32_t CFileUtilCreateUniqueFile(const platform::String& path, const platform::String& separator,
                                                 std::uint32_t permissions, platform::String* created);
