// Decoding by libavcodec.
#pragma once

#include "media/ffmpeg/Codec.h"

namespace platform::ffmpeg {

class FFmpegCodec final : public Codec {
public:
    /// As Codec::open.
    static std::unique_ptr<Codec> open(const AVCodecParameters& parameters, int numerator, int denominator,
                                       Padding padding, std::int32_t& status);

    const AVFrame& frame() const override { return *frame_; }
    int sourceBits() const override;
    CodingProfile profile() const override;
    bool decodesDSD() const override;
    Result receive() override;
    Sent send(const AVPacket* packet) override;
    void flush() override;

private:
    explicit FFmpegCodec(CodecContext context);

    CodecContext context_;
    Frame frame_;
};

} // namespace platform::ffmpeg
