// The codings that Ogg streams hold: what their headers say, and how many frames a packet decodes to.
#pragma once

#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <memory>
#include <optional>

namespace platform {

/// Made for Vorbis, Opus and FLAC.
class OggCoding {
public:
    /// By the first packet of a stream; null when it begins no coding that is known here.
    static std::unique_ptr<OggCoding> of(BytesView first);

    OggCoding() = default;
    virtual ~OggCoding() = default;
    OggCoding(const OggCoding&) = delete;
    OggCoding& operator=(const OggCoding&) = delete;

    const StreamDescription& format() const { return format_; }
    /// As SoundFacts::speakers.
    std::uint32_t speakers() const { return speakers_; }
    /// Frames at the start of the stream that are no sound.
    std::uint32_t primingFrames() const { return priming_; }

    /// Whether packets of sound follow, and no more headers.
    virtual bool hasHeaders() const = 0;
    /// Takes the next header behind the first; false when it is not the one.
    virtual bool takeHeader(BytesView packet) = 0;
    /// What the packet behind the last one decodes to, also 0; none when it is no packet of sound.
    virtual std::optional<std::uint32_t> framesOf(BytesView packet) = 0;
    /// The next packet is not the one behind the last.
    virtual void leap() {}
    /// Whether the end of the stream may lie inside its last packet.
    virtual bool endsInsidePacket() const { return true; }
    /// The number of the first frame of the last packet, where it says so.
    virtual std::optional<std::uint64_t> firstFrame() const { return {}; }

protected:
    StreamDescription format_;
    std::uint32_t speakers_ = 0;
    std::uint32_t priming_ = 0;
};

} // namespace platform
