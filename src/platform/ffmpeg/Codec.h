// A decoder of packets.
#pragma once

#include "platform/ffmpeg/Handles.h"

#include <cstdint>

namespace platform::ffmpeg {

/// One thread, and nothing said. The frame that came out last stays until the next is asked for.
class Codec {
public:
    /// Whether frames that a stream marks as padding come out too.
    enum class Padding { kept, dropped };

    /// Of packets whose times are in `numerator / denominator` seconds; 0 / 1 leaves them as they are. Without a
    /// decoder for the coding isOpen() is false afterwards, with the status.
    Codec(const AVCodecParameters& parameters, int numerator, int denominator, Padding padding, std::int32_t& status);

    bool isOpen() const { return context_ != nullptr; }
    const AVCodecContext& context() const { return *context_; }
    const AVFrame& frame() const { return *frame_; }

    enum class Result { frame, needsPacket, end, failed };
    /// The next frame of the packets sent. After `failed`, which is one packet's, it goes on.
    Result receive();
    /// Null: no packet follows. A packet that cannot be decoded is passed over. False only when memory is short.
    bool send(const AVPacket* packet);
    /// Forgets everything sent.
    void flush();

private:
    CodecContext context_;
    Frame frame_;
};

} // namespace platform::ffmpeg
