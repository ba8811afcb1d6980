// Describes a file with the library's own readers, or with a decoder where only decoding can count.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>
#include <string>

/// Keeps writers away while it reads. Throws Failure.
AudioFileInfo describeFile(const std::string& path, bool quiet);
/// The same for a file that the caller keeps writers away from.
AudioFileInfo describeSound(const std::string& path);
/// The same, and keeps the file open; what it is says Info().
void openSound(CAudioFileIO& file, const std::string& path);
/// The second half: for a file that Open has opened.
void describeOpened(CAudioFileIO& file, const std::string& path);

/// The number of frames that the headers promise if it exceeds the real one; 0 if that is unknown.
std::int64_t promisedFrames(const AudioFileInfo& info);

/// 0 if it is unknown.
double durationOf(const AudioFileInfo& info);
/// Bits per second of compressed sound; 0 if unknown, as for one track of several.
std::int64_t bitRateOf(const AudioFileInfo& info);
