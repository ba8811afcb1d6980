// A copy of an open file with everything that makes it that file: content, owner, mode, times, extended attributes.
#pragma once

#include "files/FileProblem.h"
#include "platform/FileAttributes.h"

#include <cstdint>
#include <functional>

/// Hears how many bytes of all are copied; not called where nothing has to be copied.
using FileCopyProgress = std::function<void(std::int64_t done, std::int64_t all)>;

/// Makes the empty file `to` equal in content to `from`: shares its blocks where the file system can, else copies the
/// data and keeps the holes. Both are descriptors. Problems: system, shortened.
KT_EXPORT FileProblem CopyFileContent(int from, int to, const FileCopyProgress& progress = {});

/// Which times a copy takes over: only that of the last access, or that of the last modification too.
enum class KeptTimes : bool { accessOnly, all };

/// Gives `to` the owner, permissions and times in `attributes`, and the extended attributes of `from`. Call it last,
/// since writing changes the times. Problems: owner, attribute, system.
KT_EXPORT FileProblem CopyFileAttributes(int from, const platform::FileAttributes& attributes, int to,
                                         KeptTimes times = KeptTimes::all);
