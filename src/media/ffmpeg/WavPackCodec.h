// Decoding by libwavpack.
#pragma once

#include "media/ffmpeg/Codec.h"

#include <cstdint>

namespace platform::ffmpeg {

/// Decodes each packet by itself: the blocks of a time span with their headers, as FFmpeg returns them from WavPack and
/// Matroska files. A packet fails if it contradicts its checksums. DSD, whose blocks depend on those before them, is
/// left to libavcodec.
class WavPackCodec final : public Codec {
public:
    /// As Codec::open.
    static std::unique_ptr<Codec> open(const AVCodecParameters& parameters, int numerator, int denominator,
                                       Padding padding, std::int32_t& status);

    const AVFrame& frame() const override;
    int sourceBits() const override;
    bool decodesDSD() const override { return isDSD_; }
    Result receive() override;
    Sent send(const AVPacket* packet) override;
    void flush() override;

private:
    explicit WavPackCodec(std::unique_ptr<Codec> ofDSD);
    bool takeHeader();
    bool decode();

    std::unique_ptr<Codec> ofDSD_;
    bool isDSD_ = false;
    Packet packet_; // the packet to decode; empty if there is none
    Frame frame_;
    bool isEnd_ = false;
    int sourceBits_ = 0;
};

} // namespace platform::ffmpeg
