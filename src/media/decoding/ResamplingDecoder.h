// Another sample rate: a decoder on top of a decoder, exact to the frame wherever reading begins.
#pragma once

#include "media/decoding/AudioDecoder.h"
#include "media/decoding/FrameConverter.h"
#include "media/decoding/Resampler.h"

#include <memory>
#include <vector>

namespace platform {

/// Frame n has the time of the source's frame n x p / q, where p / q is the ratio of the rates in lowest terms. There
/// are ceil(frames x q / p) frames, all that begin before the source's end. The sound has silence on either side.
///
/// A frame is the same, bit for bit, however it is reached: conversion begins at a source frame that is a multiple of
/// p, where a result frame coincides with it, so the phases are those of any other run; and it begins as far ahead of
/// the wanted frame as the conversion reaches.
class ResamplingDecoder final : public AudioDecoder {
public:
    /// The caller keeps the source, and must seek it before reading from it again. Frames are 32-bit floats of
    /// `channels` channels, mixed before the conversion (FrameConverter). The resampler has that many channels and
    /// converts from the source's rate to `rate`, both whole.
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
    std::uint64_t lead_ = 0; // periods of q frames converted ahead of the wanted frame

    FrameConverter converter_;
    std::vector<std::byte> raw_; // frames from the source
    std::vector<float> piece_;   // frames for the resampler
    std::vector<float> dropped_;
    std::uint32_t pieceFrames_ = 0;

    std::uint64_t frame_ = 0;
    bool isAtFrame_ = false;    // `frame_` is next, after the frames to drop
    std::uint64_t silence_ = 0; // silent frames to feed before the source's next frame
    std::uint64_t toDrop_ = 0;  // frames to discard before `frame_`
};

} // namespace platform
