// What a stream of MPEG audio layer II says of itself (ISO/IEC 11172-3 and 13818-3), every frame of it.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. All headers are read, which must be of one kind and lead from one frame to the next, from the
/// start of the file to its end. Bit rates may differ, but for "free format".
std::int32_t readLayerIIInfo(PacketFile& file, CompressedAudio& audio);

} // namespace platform
