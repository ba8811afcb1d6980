// The boxes of MP4 and MOV files (ISO/IEC 14496-12, 4.2).
#pragma once

#include "media/packets/PacketFile.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <optional>

namespace platform {

/// Positions in the file; the body follows the header.
struct MP4Box {
    FourCC type = 0;
    std::uint64_t body = 0;
    std::uint64_t end = 0;

    std::uint64_t size() const { return end - body; }
};

/// Iterates over the boxes between two positions.
class MP4Boxes {
public:
    MP4Boxes(PacketFile& file, std::uint64_t position, std::uint64_t end) : file_(file), position_(position), end_(end)
    {
    }
    /// The boxes in a box, after the first `fields` bytes of its body.
    MP4Boxes(PacketFile& file, const MP4Box& parent, std::uint64_t fields = 0);

    /// False at the end, and at bytes that are no box. A box that claims too much ends with the room for it.
    bool next(MP4Box& box);
    /// The next box of a type.
    std::optional<MP4Box> find(FourCC type);

private:
    PacketFile& file_;
    std::uint64_t position_;
    std::uint64_t end_;
};

} // namespace platform
