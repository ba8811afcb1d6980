// Makes the packet table of a track from everything that its file says.
#pragma once

#include "media/packets/EditList.h"
#include "media/packets/PacketSource.h"

#include <cstdint>
#include <optional>

namespace platform {

struct TrackFrames {
    std::uint64_t inPackets = 0; // in all packets that are present
    std::uint64_t stated = 0;    // of these, by the track's durations
    std::uint64_t inListed = 0;  // in all packets that the file lists, including missing ones
    std::uint32_t perPacket = 0;
    std::uint32_t sampleRate = 0;
    std::uint32_t movieTimescale = 0; // units per second
    std::optional<MP4Edit> edit;
    std::optional<GaplessItem> gapless;
};

/// kFormatNotSupported if the numbers exceed a table's.
std::int32_t makePacketTable(const TrackFrames& frames, PacketTable& table);

/// A table of `valid` frames after `priming`, of the `inPackets` that are present; both are cut to these.
std::int32_t makePacketTable(std::uint64_t inPackets, std::uint64_t priming, std::uint64_t valid, PacketTable& table);

} // namespace platform
