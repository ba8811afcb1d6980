// What a stream of AC-3 says of itself (ATSC A/52, 5 and 7.10), every frame of it.
#pragma once

#include "media/packets/FileEnds.h"
#include "media/packets/PacketFile.h"

namespace platform {

/// As describeByEnds. All headers are read, which must be of one kind and lead from one frame to the next, from the
/// start of the file to its end; the first frame and the last four must have the right checksums. None of the
/// extensions of the coding, which have other numbers.
std::int32_t readAC3Info(PacketFile& file, CompressedAudio& audio);

} // namespace platform
