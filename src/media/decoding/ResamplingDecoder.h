// Another sample rate: a decoder over a decoder, exact to the frame wherever it is asked to begin.
#pragma once

#include "media/decoding/AudioDecoder.h"
#include "media/decoding/FrameConverter.h"
#include "media/decoding/Resampler.h"

#include <memory>
#include <vector>

namespace platform {

/// Frame n stands at the time of the source's frame n x p / q, where p / q is the ratio of the rates in its lowest
/// terms; there are as many as have a time ahead of the source's end: ceil(frames x q / p). Silence lies on either side
/// of the sound.
///
/// A frame is the same, bit for bit, however it was come to: conversion begins at a frame of the source that is a
/// multiple of p, on which a frame of the result stands, so that the phases are those of every other run; and as far
/// ahead of the frame that is wanted as the conversion reaches.
class ResamplingDecoder final : public AudioDecoder {
public:
    /// The source stays the caller's, and must be brought to its place again by whoever reads it after this. Frames are
    /// 32-bit floats of `channels` channels, mixed ahead of the conversion (FrameConverter). The resampler is one of
    /// that many channels, from the source's rate to `rate`, both whole.
    ResamplingDecoder(AudioDecoder& source, std::unique_ptr<Resampler> resampler, std::uint32_t channels,
                      std::uint32_t rate);

    const StreamDescription& fileFormat() const override { return source_.fileFormat(); }
    const StreamDescription& frameFormat() const override { return frameFormat_; }
    std::uint64_t frameCount() const override { return frameCount_; }
    bool packetTable(PacketTable& table) const override { return source_.packetTable(table); }
    AudioHandle* file() override { return source_.file(); }
    std::int32_t seek(std::uint64_t frame) override;
    std::int32_t read(std::uint32_t& frames, void* to) override;

private:
    std::int32_t feed();
    std::int32_t drop();

    AudioDecoder& source_;
    std::unique_ptr<Resampler> resampler_;
    StreamDescription frameFormat_;
    std::uint64_t p_, q_;
    std::uint64_t frameCount_ = 0;
    std::uint64_t lead_ = 0; // periods of q frames that the conversion begins ahead of what is wanted

    FrameConverter converter_;
    std::vector<std::byte> raw_; // as the source gives them
    std::vector<float> piece_;   // as the resampler takes them
    std::vector<float> dropped_;
    std::uint32_t pieceFrames_ = 0;

    std::uint64_t frame_ = 0;
    bool isAtFrame_ = false;    // `frame_` is the next to come out, behind the frames to drop
    std::uint64_t silence_ = 0; // frames of it to take ahead of the source's next
    std::uint64_t toDrop_ = 0;  // frames to come out ahead of `frame_`
};

} // namespace platform
