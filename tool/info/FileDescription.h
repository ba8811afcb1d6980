// Describes a file with the library's own readers, or with a decoder where only decoding can count.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <cstdint>
#include <string>

/// Throws Failure.
AudioFileInfo describeFile(const std::string& path, bool quiet);

/// The number of frames that the headers promise if it exceeds the real one; 0 if that is unknown.
std::int64_t promisedFrames(const AudioFileInfo& info);
