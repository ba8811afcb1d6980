// What a WavPack file says of itself, and whether its blocks bear it out.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds; of a correction file the same as of its main file. All headers are read, which must lead from one
/// block to the next, up to the end of the file or a tag, and to the number of frames that the first one promises. The
/// first blocks and those of the last kProvenFrames must have their checksums. None that holds DSD.
std::int32_t readWavPackInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
