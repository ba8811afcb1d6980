// What a FLAC file (RFC 9639) says of itself, and whether it is whole, as its last frame tells.
#pragma once

#include "media/containers/HeaderWindow.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

struct FLACInfo {
    StreamDescription format; // "flac"
    std::uint64_t frames = 0; // no more than blocks of the smallest size can hold
    std::uint64_t statedFrames = 0;
    bool framesAreStated = false; // the last frame does not prove them
    std::uint32_t speakers = 0;   // that the channels feed, as bits of WAVE's channel mask
};

/// Of a file that begins with "fLaC". kStatusEndOfFile for one that ends in its header, or the status of a read that
/// failed.
std::int32_t readFLACInfo(HeaderWindow& file, FLACInfo& info);

/// Whether a frame whose checksums are right ends with `tail`, the last bytes of a file, and its last sample is the one
/// with number `samples` - 1. `blockSize` is that of all frames but the last, where they have one size.
bool flacEndsAt(BytesView tail, std::uint64_t samples, std::uint32_t blockSize);

} // namespace platform
