// The packet table of a track, from all that its file says of it.
#pragma once

#include "media/packets/EditList.h"
#include "media/packets/PacketSource.h"

#include <cstdint>
#include <optional>

namespace platform {

struct TrackFrames {
    std::uint64_t inPackets = 0; // in all packets that are there
    std::uint64_t stated = 0;    // of these, by the durations that the track states
    std::uint64_t inListed = 0;  // in all packets that the file lists, also those that it has lost
    std::uint32_t perPacket = 0;
    std::uint32_t sampleRate = 0;
    std::uint32_t movieTimescale = 0; // units in a second
    std::optional<MP4Edit> edit;
    std::optional<GaplessItem> gapless;
};

/// kFormatNotSupported when the numbers are beyond a table's.
std::int32_t makePacketTable(const TrackFrames& frames, PacketTable& table);

/// A table of `valid` frames behind `priming`, of the `inPackets` that there are; both are cut down to what there is.
std::int32_t makePacketTable(std::uint64_t inPackets, std::uint64_t priming, std::uint64_t valid, PacketTable& table);

} // namespace platform
