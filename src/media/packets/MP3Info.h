// What the first frame of an MP3 file says about the others: the header "Xing" or "Info", followed by the encoder's
// delay in what LAME and others write, or "VBRI". That frame is no sound.
#pragma once

#include "media/packets/MPEGFrameHeader.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>

namespace platform {

struct MP3Info {
    /// Frames that the encoder added around the sound.
    struct Padding {
        std::uint32_t delay = 0;
        std::uint32_t padding = 0;
    };

    std::optional<std::uint32_t> frameCount; // MPEG frames, without this one
    std::optional<std::uint32_t> byteCount;  // of all frames, with this one
    std::optional<Padding> padding;

    /// None if `frame`, which begins with `header`, is one of sound. Nothing is read from "VBRI", because its writers
    /// count differently.
    static std::optional<MP3Info> parse(const MPEGFrameHeader& header, BytesView frame);
};

} // namespace platform
