// What a FLAC file (RFC 9639) says of itself, and whether it is whole, as its last frame tells.
#pragma once

#include "media/containers/HeaderWindow.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <optional>

namespace platform {

struct FLACInfo {
    StreamDescription format; // "flac"
    std::uint64_t frames = 0; // no more than blocks of the smallest size can hold
    std::uint64_t statedFrames = 0;
    bool framesAreStated = false; // the last frame does not prove them
    std::uint32_t speakers = 0;   // that the channels feed, as bits of WAVE's channel mask
};

/// What the metadata block "STREAMINFO" says (RFC 9639, 8.2).
struct FLACProperties {
    static constexpr std::size_t kSize = 18; // of what is read of it: all but a checksum of the sound

    StreamDescription format;       // "flac"
    std::uint32_t mostInBlock = 0;  // samples; of every block but the last, where they have one size
    std::uint32_t largestFrame = 0; // bytes; 0 when it is not known
    std::uint64_t samples = 0;      // of each channel; 0 when it is not known
};
FLACProperties readFLACProperties(BytesView bytes);

/// Which speakers so many channels feed, 1 to 8, when no comment says otherwise.
std::uint32_t usualSpeakersOfFLAC(std::uint32_t channels);

struct FLACFrame {
    std::uint64_t first = 0; // the number of its first sample
    std::uint32_t samples = 0;
    // Rate and bits are 0 when they are left to the file to say.
    std::uint32_t sampleRate = 0;
    std::uint32_t channels = 0;
    std::uint32_t bits = 0;
};
/// By the header that the bytes begin with (RFC 9639, 9.1), whose checksum is compared; none when they begin with none.
std::optional<FLACFrame> parseFLACFrame(BytesView bytes, std::uint32_t blockSize);

/// Of a file that begins with "fLaC". kStatusEndOfFile for one that ends in its header, or the status of a read that
/// failed.
std::int32_t readFLACInfo(HeaderWindow& file, FLACInfo& info);

/// Whether a frame whose checksums are right ends with `tail`, the last bytes of a file, and its last sample is the one
/// with number `samples` - 1. `blockSize` is that of all frames but the last, where they have one size.
bool flacEndsAt(BytesView tail, std::uint64_t samples, std::uint32_t blockSize);

} // namespace platform
