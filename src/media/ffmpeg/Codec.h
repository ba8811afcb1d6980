// A decoder of packets.
#pragma once

#include "media/ffmpeg/Handles.h"
#include "media/samples/SoundFacts.h"

#include <cstdint>
#include <memory>

namespace platform::ffmpeg {

/// Single-threaded and silent. The last frame stays valid until the next is requested.
class Codec {
public:
    /// Whether frames that a stream marks as padding come out too.
    enum class Padding { kept, dropped };

    /// A decoder for packets whose times are in units of `numerator / denominator` seconds; 0 / 1 passes times through.
    /// Null, with the status, if there is no decoder for the coding.
    static std::unique_ptr<Codec> open(const AVCodecParameters& parameters, int numerator, int denominator,
                                       Padding padding, std::int32_t& status);

    Codec() = default;
    virtual ~Codec() = default;
    Codec(const Codec&) = delete;
    Codec& operator=(const Codec&) = delete;

    virtual const AVFrame& frame() const = 0;
    /// Bits per sample before coding; 0 if unknown.
    virtual int sourceBits() const = 0;
    virtual CodingProfile profile() const { return CodingProfile::unknown; }
    /// Whether each frame holds eight bits of 1-bit sound.
    virtual bool decodesDSD() const { return false; }

    enum class Result { frame, needsPacket, end, failed };
    /// The next frame of the packets sent. `failed` concerns one packet; decoding continues after it.
    virtual Result receive() = 0;
    enum class Sent { taken, failed, outOfMemory };
    /// Null ends the stream. A packet that cannot be decoded fails here or in receive().
    virtual Sent send(const AVPacket* packet) = 0;
    /// Discards everything sent.
    virtual void flush() = 0;
};

} // namespace platform::ffmpeg
