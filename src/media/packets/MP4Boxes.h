// The boxes that MP4 and MOV files are made of (ISO/IEC 14496-12, 4.2).
#pragma once

#include "media/packets/PacketFile.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <optional>

namespace platform {

/// Places in the file: the body begins behind the header.
struct MP4Box {
    FourCC type = 0;
    std::uint64_t body = 0;
    std::uint64_t end = 0;

    std::uint64_t size() const { return end - body; }
};

/// The boxes between two places, one after the other.
class MP4Boxes {
public:
    MP4Boxes(PacketFile& file, std::uint64_t position, std::uint64_t end) : file_(file), position_(position), end_(end)
    {
    }
    /// Those in a box, behind the first `fields` bytes of its body.
    MP4Boxes(PacketFile& file, const MP4Box& parent, std::uint64_t fields = 0);

    /// False at the end, and where no box is. One that claims to be longer than the room for it ends with that.
    bool next(MP4Box& box);
    /// The next one of a type.
    std::optional<MP4Box> find(FourCC type);

private:
    PacketFile& file_;
    std::uint64_t position_;
    std::uint64_t end_;
};

} // namespace platform
