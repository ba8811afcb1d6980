// What a TTA1 file (tausoft.org, "True Audio codec: format description") says about itself, and whether its frames
// confirm it.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. The header, the table of frames, the first frame and those of the last kProvenFrames must have
/// valid checksums; all frames together must fill the file between its tags.
std::int32_t readTTAInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
