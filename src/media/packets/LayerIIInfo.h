// What every frame of an MPEG audio layer II stream says about it (ISO/IEC 11172-3 and 13818-3).
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. Reads all headers, which must be of one kind and lead from frame to frame through the whole file.
/// Bit rates may vary, except for "free format".
std::int32_t readLayerIIInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
