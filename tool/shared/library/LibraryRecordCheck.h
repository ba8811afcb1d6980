// Whether a record that comes from outside, a file of records or the index of another machine, can be one.
#pragma once

#include "tool/shared/library/LibraryRecord.h"

#include <string>

/// Throws the Failure of a record that reading a file does not make: places that are not absolute, or that hold "..",
/// numbers out of range, texts that are not UTF-8, points that do not fit, times of indexing that lie ahead.
void requireSound(const LibraryRecord& record);
/// The same for the path of a folder: absolute, with a slash at the end, without "." and "..".
void requireFolderPath(const std::string& path);
/// The same for a name in a folder.
void requireFileName(const std::string& name);
