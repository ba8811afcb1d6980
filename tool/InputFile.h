// Files named on the command line, opened so that nothing but a regular file is ever touched or waited for.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <string>

/// Throws the Failure that says why `path` names no regular file: missing, a folder, a FIFO, a device.
void requireRegularFile(const std::string& path);

/// The library's reference to a regular file; throws Failure, also for a path that is not UTF-8.
CFileRef referenceTo(const std::string& path);

/// Opens `path` and makes sure that it holds a container; throws Failure.
void openContainer(CAudioFileIO& file, const std::string& path, unsigned int mode);
