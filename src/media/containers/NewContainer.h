// The headers of new audio files: everything ahead of their samples.
#pragma once

#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>

namespace platform {

struct NewContainer {
    FourCC fileType = 0; // "WAVE", "AIFF", "AIFC" or "caff"
    /// Packed linear PCM; bytes and frames per packet may be left out. WAVE is little-endian, AIFF big-endian without
    /// floats, AIFC has no little-endian floats; 8-bit samples are unsigned in WAVE and signed elsewhere, whatever the
    /// format says.
    StreamDescription format;
    /// Speakers of the channels as bits of WAVE's channel mask; 0 if they are for no particular ones. Without a value
    /// WAVE gets the plain format chunk, which cannot name speakers.
    std::optional<std::uint32_t> speakers;
    std::uint64_t frames = 0; // frames that will follow
    // Writes a "fact" if the format wants one; callers who add frames later cannot keep it true.
    bool isCounted = true;
    bool hasReservation = false; // WAVE: room ("JUNK") to exceed 4 GiB; RF64 if it is exceeded already
    Bytes chunks = {};           // complete chunks ahead of the samples, with headers and pad bytes
    std::size_t dataOffset = 0;  // start of the samples, reached by filler; 0 for any
};

/// Empty if the container cannot hold the format, or if its size fields cannot state that many frames.
Bytes headerOf(NewContainer file);

} // namespace platform
