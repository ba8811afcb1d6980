// Facts from a file's name and folder, without opening it.
#pragma once

#include "platform/core/FourCC.h"
#include "platform/core/Value.h"
#include "tool/shared/input/StereoNames.h"

#include <optional>
#include <string>

struct FileFacts {
    FourCC typeByName = 0; // from the extension; 0 if it is unknown
    std::optional<StereoHalf> stereo;
    std::optional<platform::Date> modified;
};

/// Throws Failure if the path is no regular file.
FileFacts factsOf(const std::string& path);
