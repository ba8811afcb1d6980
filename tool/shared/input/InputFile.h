// Files named on the command line, opened so that nothing but a regular file is ever touched or waited for.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <string>

/// Throws the Failure that says why `path` names no regular file: missing, a folder, a FIFO, a device.
void requireRegularFile(const std::string& path);

/// The path of a regular file with its symbolic links resolved; throws Failure.
std::string resolvedPath(const std::string& path);

/// `found`, which lies in the folder of the file itself that `given` leads to, as a path in the words of `given`, for
/// messages: "a/x.wav.bak" where that is "a/x.wav". As it is where `given` is a link to another folder.
std::string asGiven(const std::string& found, const std::string& given);

/// The library's reference to a regular file, or to standard input for "-"; throws Failure.
CFileRef referenceTo(const std::string& path);

/// Opens `path` for reading and makes sure that it is an audio file, of any kind; throws Failure.
void openAudio(CAudioFileIO& file, const std::string& path);

/// Where the sound of `path` could not be had with that status: throws the Failure that says what the file lacks. Of
/// input/output errors it speaks only where the disk has them.
[[noreturn]] void failForSound(const std::string& path, std::int32_t status);

/// Of a file that is not the container that a verb wants: throws the Failure that says what it lacks, unless it is
/// audio of another kind, by its content or its name.
void requireKnown(const std::string& path);

/// Makes ready to read what `file` holds; the Failure that it throws says what to install where that would help.
void requireDecoder(CAudioFileIO& file);

/// Opens `path` and makes sure that it holds a container that takes chunks; throws Failure.
void openContainer(CAudioFileIO& file, const std::string& path, unsigned int mode);
/// Opens `path` for reading and makes sure that it has chunks, also in a container that is only read; throws Failure.
void openChunks(CAudioFileIO& file, const std::string& path);
