// What an Ogg file (RFC 3533) of one stream of Vorbis, Opus or FLAC says of itself, and whether its pages bear it out.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. The headers are read, the first packets of sound, and the pages of the last kProvenFrames: there
/// every checksum must be right and every page's count what its packets decode to; the last one must be marked so, and
/// end with the file.
std::int32_t readOggInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
