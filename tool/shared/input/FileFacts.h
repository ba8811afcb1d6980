// What a file's name and folder tell of it, ahead of any look inside.
#pragma once

#include "platform/core/FourCC.h"
#include "platform/core/Value.h"

#include <optional>
#include <string>

/// One half of a stereo pair that is kept as two mono files, and the other.
struct StereoHalf {
    bool isLeft = false;
    std::string partner; // its path, in the folder of the file as that was written
    bool partnerExists = false;
};

/// None for a name without a stereo suffix. Names need not be UTF-8.
std::optional<StereoHalf> stereoHalf(const std::string& path);

struct FileFacts {
    FourCC typeByName = 0; // 0: the extension means none
    std::optional<StereoHalf> stereo;
    std::optional<platform::Date> modified;
};

/// Throws Failure for what is no regular file.
FileFacts factsOf(const std::string& path);
