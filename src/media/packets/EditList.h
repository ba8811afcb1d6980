// Which part of an MP4 file's frames is the sound, according to its edit list (ISO/IEC 14496-12, 8.6.6) and to the
// gapless item among its tags, a freeform item ("----") whose name ends in "SMPB".
#pragma once

#include "media/packets/MP4Boxes.h"

#include <cstdint>
#include <optional>

namespace platform {

struct MP4Edit {
    std::uint64_t start = 0;    // in the track's units
    std::uint64_t duration = 0; // in the movie's units; 0: to the end
};

/// Reads the one edit of a track; none in `edit` if there is no list. kFormatNotSupported for lists that do more than
/// cut start and end.
std::int32_t readEditList(PacketFile& file, const MP4Box& track, std::optional<MP4Edit>& edit);

/// In frames.
struct GaplessItem {
    std::uint32_t priming = 0;
    std::uint32_t remainder = 0;
    std::uint64_t validFrames = 0;
};

/// None if the movie has no gapless item that can be read. Its value is a text of hexadecimal numbers after spaces, of
/// which the second, third and fourth are these.
std::optional<GaplessItem> readGaplessItem(PacketFile& file, const MP4Box& movie);

} // namespace platform
