// Operations on files named by reference.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/FourCC.h"

#include <cstdint>

/// Creates an empty file with the given POSIX permissions (less the process's mask); kStatusDuplicateName when
/// something is there already. Type and creator codes are accepted and ignored: no file system here keeps them.
KT_EXPORT std::int32_t CFileUtilCreate(const CFileRef& file, FourCC type, FourCC creator, std::uint32_t permissions);
/// Removes a file; of a symbolic link the link. kStatusParameterError for a folder and a reference without a path.
KT_EXPORT std::int32_t CFileUtilDelete(const CFileRef& file);
/// The size in bytes of a file, that of its target for a symbolic link; a status, which is negative, when it cannot be
/// had: kStatusParameterError for a folder.
KT_EXPORT long long CFileUtilFileSize(const CFileRef& file);
