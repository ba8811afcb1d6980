// Owners of what FFmpeg allocates.
#pragma once

#include <memory>

struct AVCodecContext;
struct AVCodecParameters;
struct AVFormatContext;
struct AVFrame;
struct AVPacket;

namespace platform::ffmpeg {

struct Release {
    void operator()(AVCodecContext* context) const;
    void operator()(AVCodecParameters* parameters) const;
    void operator()(AVFormatContext* context) const;
    void operator()(AVFrame* frame) const;
    void operator()(AVPacket* packet) const;
};

using CodecContext = std::unique_ptr<AVCodecContext, Release>;
using CodecParameters = std::unique_ptr<AVCodecParameters, Release>;
using FormatContext = std::unique_ptr<AVFormatContext, Release>;
using Frame = std::unique_ptr<AVFrame, Release>;
using Packet = std::unique_ptr<AVPacket, Release>;

/// Raises a context's messages beyond every level, because a host may show those of its own contexts. The log uses the
/// low 8 bits, and FFmpeg itself adds up to 127.
constexpr int kLogLevelOffset = 64;

// These throw std::bad_alloc.
CodecParameters makeCodecParameters();
Frame makeFrame();
Packet makePacket();

} // namespace platform::ffmpeg
