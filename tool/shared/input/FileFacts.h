// What a file's name and folder tell of it, ahead of any look inside.
#pragma once

#include "platform/core/FourCC.h"
#include "platform/core/Value.h"
#include "tool/shared/input/StereoNames.h"

#include <optional>
#include <string>

struct FileFacts {
    FourCC typeByName = 0; // 0: the extension means none
    std::optional<StereoHalf> stereo;
    std::optional<platform::Date> modified;
};

/// Throws Failure for what is no regular file.
FileFacts factsOf(const std::string& path);
