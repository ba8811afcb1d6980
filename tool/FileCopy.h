// A copy of a file with everything that makes it that file: content, owner, mode, times, extended attributes.
#pragma once

#include <sys/stat.h>

class Progress;

/// Makes the empty file `to` equal in content to `from`: shares its blocks where the file system can, else copies the
/// data and keeps the holes. Throws Failure.
void copyContent(int from, int to, Progress& progress);

/// Gives `to` the owner, mode, extended attributes and times of `from`, whose status was `status`. Must come last,
/// since writing changes the times. Throws Failure when one cannot be kept.
void copyAttributes(int from, const struct stat& status, int to);

/// Commits a file, or the folder that holds `path`, to storage. Throws Failure.
void synchronize(int descriptor);
void synchronizeFolderOf(const char* path);
