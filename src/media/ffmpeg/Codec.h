// A decoder of packets.
#pragma once

#include "media/ffmpeg/Handles.h"
#include "media/samples/SoundFacts.h"

#include <cstdint>
#include <memory>

namespace platform::ffmpeg {

/// One thread, and nothing said. The frame that came out last stays until the next is asked for.
class Codec {
public:
    /// Whether frames that a stream marks as padding come out too.
    enum class Padding { kept, dropped };

    /// Of packets whose times are in `numerator / denominator` seconds; 0 / 1 leaves them as they are. Null, with the
    /// status, without a decoder for the coding.
    static std::unique_ptr<Codec> open(const AVCodecParameters& parameters, int numerator, int denominator,
                                       Padding padding, std::int32_t& status);

    Codec() = default;
    virtual ~Codec() = default;
    Codec(const Codec&) = delete;
    Codec& operator=(const Codec&) = delete;

    virtual const AVFrame& frame() const = 0;
    /// Bits of a sample ahead of coding; 0 where that is not known.
    virtual int sourceBits() const = 0;
    virtual CodingProfile profile() const { return CodingProfile::unknown; }
    /// Whether the frames are made of 1-bit sound, of eight bits each.
    virtual bool decodesDSD() const { return false; }

    enum class Result { frame, needsPacket, end, failed };
    /// The next frame of the packets sent. After `failed`, which is one packet's, it goes on.
    virtual Result receive() = 0;
    enum class Sent { taken, failed, outOfMemory };
    /// Null: no packet follows. A packet that cannot be decoded has failed here or in receive().
    virtual Sent send(const AVPacket* packet) = 0;
    /// Forgets everything sent.
    virtual void flush() = 0;
};

} // namespace platform::ffmpeg
