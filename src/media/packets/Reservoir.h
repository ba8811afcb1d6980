// How far back the decoding of an MP3 packet reaches.
#pragma once

#include "media/packets/MPEGFrameHeader.h"

#include <algorithm>
#include <cstdint>

namespace platform {

/// Packets to decode ahead of `packet`, of a stream whose frames have headers like `any`: `mainDataSize(i)` is what
/// packet i holds of main data, in bytes, and is asked going backwards.
template <class MainDataSize>
std::uint64_t mp3PreRoll(std::uint64_t packet, const MPEGFrameHeader& any, MainDataSize mainDataSize)
{
    constexpr std::uint64_t kLeast = 10;
    constexpr std::uint64_t kSynthesis = 2; // overlap, and the history of the filterbank: a granule each, one a packet
    std::uint64_t ahead = std::min(kSynthesis, packet);
    for (std::uint32_t reached = 0; reached < any.reservoirSize() && ahead < packet; ++ahead)
        reached += mainDataSize(packet - ahead - 1);
    return std::min(packet, std::max(ahead, kLeast));
}

} // namespace platform
