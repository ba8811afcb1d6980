// What a WavPack file says about itself, and whether its blocks confirm it.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds; a correction file is checked like its main file. Reads all headers, which must lead from block to
/// block up to the end of the file or a tag, and to the number of frames that the first one promises. The first blocks
/// and those of the last kProvenFrames must have valid checksums. DSD is not accepted.
std::int32_t readWavPackInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
