// What an Ogg file (RFC 3533) with one stream of Vorbis, Opus or FLAC says about itself, and whether its pages confirm
// it.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. Reads the headers, the first packets of sound, and the pages of the last kProvenFrames, where
/// every checksum must be valid and every page must count what its packets decode to; the last page must be marked as
/// such and end the file.
std::int32_t readOggInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
