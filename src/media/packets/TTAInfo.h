// What a TTA1 file (tausoft.org, "True Audio codec: format description") says of itself, and whether its frames bear it
// out.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. Header, table of frames, the first frame, and those of the last kProvenFrames must have the right
/// checksums; all frames together must fill the file between its tags.
std::int32_t readTTAInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
