// Files named on the command line, opened so that nothing but a regular file is ever touched or waited for.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <string>

/// Throws the Failure that says why `path` names no regular file: missing, a folder, a FIFO, a device.
void requireRegularFile(const std::string& path);

/// The path of a regular file with its symbolic links resolved; throws Failure.
std::string resolvedPath(const std::string& path);

/// The library's reference to a regular file; throws Failure, also for a path that is not UTF-8.
CFileRef referenceTo(const std::string& path);

/// Opens `path` for reading and makes sure that it is an audio file, of any kind; throws Failure.
void openAudio(CAudioFileIO& file, const std::string& path);

/// Makes ready to read what `file` holds; the Failure that it throws says what to install where that would help.
void requireDecoder(CAudioFileIO& file);

/// Opens `path` and makes sure that it holds a container that takes chunks; throws Failure.
void openContainer(CAudioFileIO& file, const std::string& path, unsigned int mode);
/// Opens `path` for reading and makes sure that it has chunks, also in a container that is only read; throws Failure.
void openChunks(CAudioFileIO& file, const std::string& path);
