// Operations on files named by reference.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/FourCC.h"

#include <cstdint>

/// Creates an empty file with the given POSIX permissions, less the process's mask. kStatusDuplicateName when
/// something has the name. Type and creator codes are ignored: no file system here keeps them.
KT_EXPORT std::int32_t CFileUtilCreate(const CFileRef& file, FourCC type, FourCC creator, std::uint32_t permissions);
/// Removes a file, or a symbolic link itself. kStatusParameterError for a folder and a reference without a path.
KT_EXPORT std::int32_t CFileUtilDelete(const CFileRef& file);
/// The size of a file in bytes, of a symbolic link's target; a negative status on failure: kStatusParameterError for
/// a folder.
KT_EXPORT long long CFileUtilFileSize(const CFileRef& file);
