// The tables of a track with the positions and durations of its packets (ISO/IEC 14496-12, 8.6 and 8.7).
#pragma once

#include "media/packets/MP4Boxes.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketIndex.h"

#include <cstdint>

namespace platform {

struct SampleTable {
    PacketIndex packets;             // the packets that the file holds completely
    std::uint64_t statedPackets = 0; // the packets that the tables list
    std::uint32_t duration = 0;      // per packet but the last, in the track's units
    std::uint32_t lastDuration = 0;  // of the last packet listed, not longer

    /// Of the packets that are present.
    std::uint64_t totalDuration() const;
    /// Of the packets that the tables list.
    std::uint64_t statedDuration() const;

    /// Reads the box "stbl". kFormatNotSupported if packets differ in duration or the stream changes its coding,
    /// kStatusIOError if the tables contradict each other.
    static std::int32_t read(PacketFile& file, const MP4Box& box, SampleTable& table);
};

} // namespace platform
