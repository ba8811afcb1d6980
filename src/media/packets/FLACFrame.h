// The header of a frame of FLAC (RFC 9639, 9.1). The module of decoders compiles this, too.
#pragma once

#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>

namespace platform {

struct FLACFrame {
    std::uint64_t first = 0; // number of its first sample
    std::uint32_t samples = 0;
    // Rate and bits are 0 if the frame leaves them to STREAMINFO.
    std::uint32_t sampleRate = 0;
    std::uint32_t channels = 0;
    std::uint32_t bits = 0;
};
/// Parses the header that the bytes begin with (RFC 9639, 9.1), and compares its checksum; none if there is no valid
/// header.
std::optional<FLACFrame> parseFLACFrame(BytesView bytes, std::uint32_t blockSize);

} // namespace platform
