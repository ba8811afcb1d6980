// The checksum of FLAC frames (RFC 9639, 9.3), by carry-less multiplication where the processor has it.
#pragma once

#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform::ffmpeg {

/// highFirstCRC<16, 0x8005>; 0 where the bytes end in the checksum of those ahead of it.
std::uint32_t flacCRC16(BytesView bytes);

} // namespace platform::ffmpeg
