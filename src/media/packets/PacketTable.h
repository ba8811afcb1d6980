// Which of the frames that packets decode to are sound.
#pragma once

#include <cstdint>

namespace platform {

/// The frames of a decoded file that are sound; encoders put `priming` frames ahead of them and `remainder` behind.
struct PacketTable {
    std::int64_t validFrames = 0;     // those that are sound
    std::int32_t primingFrames = 0;   // ahead of them
    std::int32_t remainderFrames = 0; // after them
};
static_assert(sizeof(PacketTable) == 16);

} // namespace platform
