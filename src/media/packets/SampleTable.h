// The tables of a track that say where its packets stand and how long they last (ISO/IEC 14496-12, 8.6 and 8.7).
#pragma once

#include "media/packets/MP4Boxes.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketIndex.h"

#include <cstdint>

namespace platform {

struct SampleTable {
    PacketIndex packets;             // those that the file holds to the last byte
    std::uint64_t statedPackets = 0; // those that its tables list
    std::uint32_t duration = 0;      // of each packet but the last, in units of the track
    std::uint32_t lastDuration = 0;  // of the last one listed, not longer

    /// Of the packets that are there.
    std::uint64_t totalDuration() const;
    /// Of those that the tables list.
    std::uint64_t statedDuration() const;

    /// From the box "stbl". kFormatNotSupported when packets differ in duration or the stream changes its coding,
    /// kStatusIOError when the tables contradict each other.
    static std::int32_t read(PacketFile& file, const MP4Box& box, SampleTable& table);
};

} // namespace platform
