// Compressed files whose first and last pieces tell how many frames they hold, and prove it by checksums or by where
// they stand: no decoder is asked.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"

#include <cstdint>
#include <string>

namespace platform {

struct CompressedAudio {
    FourCC fileType = 0;      // "MPG3", "adts", "m4af", "mp4f"; of other files a code of their own
    StreamDescription format; // rate and channels are those of the frames that decoding gives
    std::uint64_t frames = 0;
    SoundFacts facts;
};

/// What decoding the file would give, to the letter; `fileType` is what it begins as: "ogg ", "wvpk", "tta " or "MPG2".
/// AudioHandle::kFormatNotSupported for other types, and for a file about which there is any doubt: one that is cut,
/// damaged where this looks, chained, multiplexed, or of another coding. Else the status of a read that failed.
std::int32_t describeByEnds(const std::string& path, FourCC fileType, CompressedAudio& audio);

/// Frames ahead of the last one over which a file is looked at, if it is not all looked at: a decoder that counts looks
/// at as many.
inline constexpr std::uint64_t kProvenFrames = 1u << 16;

} // namespace platform
