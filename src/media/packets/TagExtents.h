// How far tags reach that stand around a stream of frames: ID3v2 ahead of it (id3.org, 2.4.0), ID3v1 and APE behind.
#pragma once

#include "media/packets/PacketFile.h"

#include <cstdint>

namespace platform {

/// The bytes of the ID3v2 tag at `position`, header and footer included; 0 when there is none.
std::uint64_t leadingTagSize(PacketFile& file, std::uint64_t position);
/// Where the ID3v2 tags at the start of the file end, however many there are; at most the file's length.
std::uint64_t endOfLeadingTags(PacketFile& file);
/// Where the tags at the end of the file begin, of those behind `start`.
std::uint64_t startOfTrailingTags(PacketFile& file, std::uint64_t start);

} // namespace platform
