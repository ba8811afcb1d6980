// Compressed files whose first and last pieces state how many frames they hold, and prove it by checksums or
// positions, so that no decoder is needed.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"

#include <cstdint>
#include <string>

namespace platform {

/// What a compressed file holds.
struct CompressedAudio {
    FourCC fileType = 0;      // "MPG3", "adts", "m4af", "mp4f"; of other files a code of their own
    StreamDescription format; // with the rate and the channels that decoding gives
    std::uint64_t frames = 0; // samples of each channel
    SoundFacts facts;         // what else the file says
};

/// What decoding the file would give, exactly; `fileType` is what it begins as: "ogg ", "wvpk", "tta " or "MPG2".
/// AudioHandle::kFormatNotSupported for other types, and for a file about which there is any doubt: one that is cut,
/// damaged where this looks, chained, multiplexed, or of another coding. Else the status of a failed read.
std::int32_t describeByEnds(const std::string& path, FourCC fileType, CompressedAudio& audio);

/// How many frames ahead of the last one are examined, of a file that is not examined whole; a decoder that counts
/// examines as many.
inline constexpr std::uint64_t kProvenFrames = 1u << 16;

} // namespace platform
