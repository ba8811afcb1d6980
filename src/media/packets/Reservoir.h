// How far back the decoding of an MP3 packet reaches.
#pragma once

#include "media/packets/MPEGFrameHeader.h"

#include <algorithm>
#include <cstdint>

namespace platform {

/// Number of packets to decode before `packet`, in a stream with frame headers like `any`. `mainDataSize(i)` is the
/// size in bytes of packet i's main data, and is called for descending i.
template <class MainDataSize>
std::uint64_t mp3PreRoll(std::uint64_t packet, const MPEGFrameHeader& any, MainDataSize mainDataSize)
{
    constexpr std::uint64_t kLeast = 10;
    constexpr std::uint64_t kSynthesis = 2; // overlap and filterbank history: one packet each
    std::uint64_t ahead = std::min(kSynthesis, packet);
    for (std::uint32_t reached = 0; reached < any.reservoirSize() && ahead < packet; ++ahead)
        reached += mainDataSize(packet - ahead - 1);
    return std::min(packet, std::max(ahead, kLeast));
}

} // namespace platform
