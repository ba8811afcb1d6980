// What the first frame of an MP3 file says of the others: the header "Xing" or "Info", with the encoder's own delay
// behind it in what LAME and others write, or "VBRI". Such a frame is no sound.
#pragma once

#include "media/packets/MPEGFrameHeader.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <optional>

namespace platform {

struct MP3Info {
    /// What the encoder put around the sound, in frames of sound.
    struct Padding {
        std::uint32_t delay = 0;
        std::uint32_t padding = 0;
    };

    std::optional<std::uint32_t> frameCount; // frames of MPEG audio, this one not counted
    std::optional<std::uint32_t> byteCount;  // of all of them, this one counted
    std::optional<Padding> padding;

    /// None when `frame`, which begins with `header`, is one of sound. Of "VBRI" nothing is told: its writers differ in
    /// what they count.
    static std::optional<MP3Info> parse(const MPEGFrameHeader& header, BytesView frame);
};

} // namespace platform
