// Extents of the tags around a stream of frames: ID3v2 before it (id3.org, 2.4.0), ID3v1 and APE after it.
#pragma once

#include "media/packets/PacketFile.h"

#include <cstdint>

namespace platform {

/// Size of the ID3v2 tag at `position`, header and footer included; 0 if there is none.
std::uint64_t leadingTagSize(PacketFile& file, std::uint64_t position);
/// End of all ID3v2 tags at the start of the file; at most the file's length.
std::uint64_t endOfLeadingTags(PacketFile& file);
/// Start of the tags at the end of the file, not before `start`.
std::uint64_t startOfTrailingTags(PacketFile& file, std::uint64_t start);

} // namespace platform
