// What kind of item a mode says.
#pragma once

#include "platform/SystemCalls.h"

#include <cstdint>

namespace platform {

/// Of the mode bits of `stat` and `statx`.
FileKind kindOfMode(std::uint32_t mode);

} // namespace platform
