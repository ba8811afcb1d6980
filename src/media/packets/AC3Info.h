// What every frame of an AC-3 stream says about it (ATSC A/52, 5 and 7.10).
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. Reads all headers, which must be of one kind and lead from frame to frame through the whole file;
/// the first frame and the last four must have valid checksums. Does not accept the coding's extensions, which have
/// other version numbers.
std::int32_t readAC3Info(PacketFile& file, CompressedAudio& audio);

} // namespace platform
