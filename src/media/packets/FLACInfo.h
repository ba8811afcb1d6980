// What a FLAC file (RFC 9639) says about itself, and whether its last frame shows that it is whole.
#pragma once

#include "media/containers/HeaderWindow.h"
#include "media/packets/FLACFrame.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <optional>

namespace platform {

struct FLACInfo {
    StreamDescription format; // "flac"
    std::uint64_t frames = 0; // at most what blocks of the smallest size can hold
    std::uint64_t statedFrames = 0;
    bool framesAreStated = false; // the last frame does not prove `frames`
    std::uint32_t speakers = 0;   // of the channels, as bits of WAVE's channel mask
};

/// The metadata block "STREAMINFO" (RFC 9639, 8.2).
struct FLACProperties {
    static constexpr std::size_t kSize = 18; // the part that is read: all but the digest of the sound

    StreamDescription format;       // "flac"
    std::uint32_t mostInBlock = 0;  // samples; the size of all blocks but the last, if they have one size
    std::uint32_t largestFrame = 0; // bytes; 0 if unknown
    std::uint64_t samples = 0;      // per channel; 0 if unknown
};
FLACProperties readFLACProperties(BytesView bytes);

/// The usual speakers of 1 to 8 channels, which a comment may override.
std::uint32_t usualSpeakersOfFLAC(std::uint32_t channels);

/// Reads a file that begins with "fLaC". kStatusEndOfFile if it ends inside its header, or the status of a failed read.
std::int32_t readFLACInfo(HeaderWindow& file, FLACInfo& info);

/// Whether `tail`, the last bytes of a file, ends with a frame that has valid checksums and whose last sample is number
/// `samples` - 1. `blockSize` is that of all frames but the last, if they have one size.
bool flacEndsAt(BytesView tail, std::uint64_t samples, std::uint32_t blockSize);

} // namespace platform
