// A copy of a file with everything that makes it that file: content, owner, mode, times, extended attributes.
#pragma once

#include <sys/stat.h>

class Progress;

/// Makes the empty file `to` equal in content to `from`: shares its blocks where the file system can, else copies the
/// data and keeps the holes. Throws Failure.
void copyContent(int from, int to, Progress& progress);

/// Whether the time of the last modification is that of the original, or that of the edit.
enum class Times : bool { now, kept };

/// Gives `to` the owner, mode and extended attributes of `from`, whose status was `status`, and the times. Must come
/// last, since writing changes the times. Throws Failure when one cannot be kept.
void copyAttributes(int from, const struct stat& status, int to, Times times = Times::kept);

/// Commits a file, or the folder that holds `path`, to storage. Throws Failure.
void synchronize(int descriptor);
void synchronizeFolderOf(const char* path);
