// The codings of Ogg streams: what their headers say, and how many frames a packet decodes to.
#pragma once

#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>
#include <memory>
#include <optional>

namespace platform {

/// One for each of Vorbis, Opus and FLAC.
class OggCoding {
public:
    /// Chosen by the first packet of a stream; null if its coding is unknown.
    static std::unique_ptr<OggCoding> of(BytesView first);

    OggCoding() = default;
    virtual ~OggCoding() = default;
    OggCoding(const OggCoding&) = delete;
    OggCoding& operator=(const OggCoding&) = delete;

    const StreamDescription& format() const { return format_; }
    /// As SoundFacts::speakers.
    std::uint32_t speakers() const { return speakers_; }
    /// Frames at the start of the stream that do not belong to the sound.
    std::uint32_t primingFrames() const { return priming_; }

    /// Whether all headers were read, so that packets of sound follow.
    virtual bool hasHeaders() const = 0;
    /// Reads the next header after the first; false if the packet is another.
    virtual bool takeHeader(BytesView packet) = 0;
    /// Number of frames, possibly 0, that the next packet decodes to; none if it is no packet of sound.
    virtual std::optional<std::uint32_t> framesOf(BytesView packet) = 0;
    /// Announces that the next packet does not follow the last one.
    virtual void leap() {}
    /// Whether the stream may end inside its last packet.
    virtual bool endsInsidePacket() const { return true; }
    /// Number of the first frame of the last packet, if it says so.
    virtual std::optional<std::uint64_t> firstFrame() const { return {}; }

protected:
    StreamDescription format_;
    std::uint32_t speakers_ = 0;
    std::uint32_t priming_ = 0;
};

} // namespace platform
