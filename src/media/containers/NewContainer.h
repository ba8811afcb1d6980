// The headers of new audio files: all that stands ahead of their samples.
#pragma once

#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>

namespace platform {

struct NewContainer {
    FourCC fileType = 0; // "WAVE", "AIFF", "AIFC" or "caff"
    /// Packed linear PCM; bytes and frames of a packet need not be given. WAVE is little-endian, AIFF big-endian
    /// without floats, AIFC has no little-endian floats; 8 bits are unsigned in WAVE, signed elsewhere, whatever is
    /// said.
    StreamDescription format;
    /// That the channels feed, as bits of WAVE's channel mask; 0 says that they feed none in particular. Without it
    /// WAVE has the plain format chunk, which says nothing of speakers.
    std::optional<std::uint32_t> speakers;
    std::uint64_t frames = 0; // that will follow
    bool isCounted = true; // in a "fact" where the format asks for one; whoever adds frames later cannot keep it true
    bool hasReservation = false; // of WAVE: room ("JUNK") to grow past 4 GiB; makes it RF64 once it has
    Bytes chunks = {};           // ahead of the samples: whole ones, with headers and pad bytes
    std::size_t dataOffset = 0;  // filler makes the samples begin here; 0 for none
};

/// Empty when the container cannot hold the format, or its size fields cannot say so many frames.
Bytes headerOf(NewContainer file);

} // namespace platform
