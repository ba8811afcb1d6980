// A copy of an open file with everything that makes it that file: content, owner, mode, times, extended attributes.
#pragma once

#include "files/FileProblem.h"
#include "platform/FileAttributes.h"

#include <cstdint>
#include <functional>

/// Hears of a copy now and then: bytes done, of all. Not called where nothing has to be copied.
using FileCopyProgress = std::function<void(std::int64_t done, std::int64_t all)>;

/// Makes the empty file `to` equal in content to `from`: shares its blocks where the file system can, else copies the
/// data and keeps the holes. Both are descriptors. Problems: system, shortened.
KT_EXPORT FileProblem CopyFileContent(int from, int to, const FileCopyProgress& progress = {});

/// Whether the time of the last modification is that of the original, or that of the edit.
enum class KeptTimes : bool { accessOnly, all };

/// Gives `to` the owner, the permissions and the times in `attributes`, which are those of `from` or what the caller
/// makes of them, and the extended attributes of `from`. Must come last, since writing changes the times. Problems:
/// owner, attribute, system.
KT_EXPORT FileProblem CopyFileAttributes(int from, const platform::FileAttributes& attributes, int to,
                                         KeptTimes times = KeptTimes::all);
