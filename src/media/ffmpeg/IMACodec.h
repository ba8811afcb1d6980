// IMA ADPCM as in WAVE, decoded by the published algorithm.
#pragma once

#include "media/ffmpeg/Codec.h"

#include <cstddef>
#include <cstdint>

namespace platform::ffmpeg {

/// Blocks of 4-bit samples (IMA Digital Audio Focus and Technical Working Groups, "Recommended Practices for Enhancing
/// Digital Audio Compatibility in Multimedia Systems", 1992). FFmpeg rounds the difference of two samples once, where
/// the algorithm rounds each of its terms, and so drifts away from the encoder.
class IMACodec final : public Codec {
public:
    /// As Codec::open; null, without a status, for other blocks.
    static std::unique_ptr<Codec> open(const AVCodecParameters& parameters);

    const AVFrame& frame() const override { return *frame_; }
    int sourceBits() const override { return 16; }
    Result receive() override;
    Sent send(const AVPacket* packet) override;
    void flush() override;

private:
    explicit IMACodec(const AVCodecParameters& parameters);
    bool decode(const std::uint8_t* block, std::size_t size);

    std::size_t channels_, blockSize_;
    int sampleRate_;
    Packet packet_; // blocks from `at_` on are still to be decoded; empty if there are none
    std::size_t at_ = 0;
    Frame frame_;
    bool isEnd_ = false;
};

} // namespace platform::ffmpeg
