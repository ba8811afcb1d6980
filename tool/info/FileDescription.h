// What a file is, by whatever knows it: the library's own readers, and the decoder where only that can count.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <cstdint>
#include <string>

/// Throws Failure.
AudioFileInfo describeFile(const std::string& path, bool quiet);

/// What the headers promise, where that is more than there is; 0 where it cannot be told.
std::int64_t promisedFrames(const AudioFileInfo& info);
