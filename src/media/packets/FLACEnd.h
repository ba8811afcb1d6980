// Whether a FLAC file (RFC 9639) is whole, as its last frame tells.
#pragma once

#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

/// Whether a frame whose checksums are right ends with `tail`, the last bytes of a file, and its last sample is the one
/// with number `samples` - 1. `blockSize` is that of all frames but the last, where they have one size.
bool flacEndsAt(BytesView tail, std::uint64_t samples, std::uint32_t blockSize);

} // namespace platform
