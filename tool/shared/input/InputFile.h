// Opens files named on the command line so that only regular files are touched or waited for.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <string>

/// Throws a Failure that says why `path` names no regular file: missing, a folder, a FIFO, a device.
void requireRegularFile(const std::string& path);

/// The path of a regular file with symbolic links resolved; throws Failure.
std::string resolvedPath(const std::string& path);

/// Spells `found`, a file in the folder of the file that `given` leads to, like `given`, for messages: "a/x.wav.bak" if
/// that is "a/x.wav". Unchanged if `given` is a link to another folder.
std::string asGiven(const std::string& found, const std::string& given);

/// The library's reference to a regular file, or to standard input for "-"; throws Failure.
CFileRef referenceTo(const std::string& path);

/// Opens `path` for reading and requires an audio file of any kind; throws Failure.
void openAudio(CAudioFileIO& file, const std::string& path);

/// Throws the Failure that says what `path` lacks, after its sound could not be read with that status. Mentions
/// input/output errors only if the disk has them.
[[noreturn]] void failForSound(const std::string& path, std::int32_t status);

/// Called for a file that is not the container that a verb needs: throws the Failure that says what it lacks, unless it
/// is audio of another kind by content or name.
void requireKnown(const std::string& path);

/// Prepares to read the sound of `file`; throws a Failure that names the package to install if that would help.
void requireDecoder(CAudioFileIO& file);

/// Opens `path` and requires a container that accepts chunks; throws Failure.
void openContainer(CAudioFileIO& file, const std::string& path, unsigned int mode);
/// Opens `path` for reading and requires chunks, possibly in a container that cannot be edited; throws Failure.
void openChunks(CAudioFileIO& file, const std::string& path);
