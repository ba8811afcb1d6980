#include "media/ffmpeg/IMACodec.h"

#include <algorithm>
#include <array>
#include <new>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/channel_layout.h>
}

namespace platform::ffmpeg {

namespace {

constexpr std::size_t kHead = 4, kGroup = 4; // bytes per channel: head of a block, and a group of 8 samples

constexpr std::array<std::int16_t, 89> kSteps{
    7,    8,     9,     10,    11,    12,    13,    14,    16,    17,    19,    21,    23,    25,   28,
    31,   34,    37,    41,    45,    50,    55,    60,    66,    73,    80,    88,    97,    107,  118,
    130,  143,   157,   173,   190,   209,   230,   253,   279,   307,   337,   371,   408,   449,  494,
    544,  598,   658,   724,   796,   876,   963,   1060,  1166,  1282,  1411,  1552,  1707,  1878, 2066,
    2272, 2499,  2749,  3024,  3327,  3660,  4026,  4428,  4871,  5358,  5894,  6484,  7132,  7845, 8630,
    9493, 10442, 11487, 12635, 13899, 15289, 16818, 18500, 20350, 22385, 24623, 27086, 29794, 32767};
constexpr std::array<int, 8> kStepChanges{-1, -1, -1, -1, 2, 4, 6, 8};

struct Predictor {
    int sample, step;

    std::int16_t next(unsigned code)
    {
        const int size = kSteps[static_cast<std::size_t>(step)];
        const int difference = (size >> 3) + ((code & 4) != 0 ? size : 0) + ((code & 2) != 0 ? size >> 1 : 0) +
                               ((code & 1) != 0 ? size >> 2 : 0);
        sample = std::clamp((code & 8) != 0 ? sample - difference : sample + difference, -32768, 32767);
        step = std::clamp(step + kStepChanges[code & 7], 0, static_cast<int>(kSteps.size()) - 1);
        return static_cast<std::int16_t>(sample);
    }
};

} // namespace

std::unique_ptr<Codec> IMACodec::open(const AVCodecParameters& parameters)
{
    const int channels = parameters.ch_layout.nb_channels;
    const bool isKnown = parameters.bits_per_coded_sample == 4 && channels >= 1 && channels <= 255 &&
                         parameters.block_align > channels * static_cast<int>(kHead) &&
                         parameters.block_align <= 1 << 20 && parameters.sample_rate > 0;
    return isKnown ? std::unique_ptr<Codec>(new IMACodec(parameters)) : nullptr;
}

IMACodec::IMACodec(const AVCodecParameters& parameters)
    : channels_(static_cast<std::size_t>(parameters.ch_layout.nb_channels)),
      blockSize_(static_cast<std::size_t>(parameters.block_align)),
      sampleRate_(parameters.sample_rate),
      packet_(makePacket()),
      frame_(makeFrame())
{
}

void IMACodec::flush()
{
    av_packet_unref(packet_.get());
    isEnd_ = false;
}

Codec::Sent IMACodec::send(const AVPacket* packet)
{
    isEnd_ = packet == nullptr;
    at_ = 0;
    av_packet_unref(packet_.get());
    return isEnd_ || av_packet_ref(packet_.get(), packet) == 0 ? Sent::taken : Sent::outOfMemory;
}

Codec::Result IMACodec::receive()
{
    if (packet_->size == 0)
        return isEnd_ ? Result::end : Result::needsPacket;
    const std::size_t size = std::min(blockSize_, static_cast<std::size_t>(packet_->size) - at_);
    const bool isDecoded = decode(packet_->data + at_, size);
    frame_->pts = at_ == 0 ? packet_->pts : AV_NOPTS_VALUE; // later ones follow from it
    at_ += size;
    if (at_ >= static_cast<std::size_t>(packet_->size))
        av_packet_unref(packet_.get());
    return isDecoded ? Result::frame : Result::failed;
}

bool IMACodec::decode(const std::uint8_t* block, std::size_t size)
{
    const std::size_t groups = size > kHead * channels_ ? (size - kHead * channels_) / (kGroup * channels_) : 0;
    if (groups == 0)
        return false;
    AVFrame& frame = *frame_;
    av_frame_unref(&frame);
    frame.format = AV_SAMPLE_FMT_S16;
    frame.nb_samples = static_cast<int>(1 + 8 * groups);
    frame.sample_rate = sampleRate_;
    av_channel_layout_default(&frame.ch_layout, static_cast<int>(channels_));
    if (av_frame_get_buffer(&frame, 0) < 0)
        throw std::bad_alloc();
    auto* const samples = reinterpret_cast<std::int16_t*>(frame.data[0]);
    for (std::size_t c = 0; c < channels_; ++c) {
        const std::uint8_t* const head = block + kHead * c;
        Predictor predictor{static_cast<std::int16_t>(head[0] | head[1] << 8), head[2]};
        if (predictor.step >= static_cast<int>(kSteps.size()))
            return false;
        std::int16_t* to = samples + c;
        *to = static_cast<std::int16_t>(predictor.sample);
        for (std::size_t g = 0; g < groups; ++g)
            for (std::size_t i = 0; i < kGroup; ++i) {
                const unsigned codes = block[kHead * channels_ + (g * channels_ + c) * kGroup + i];
                *(to += channels_) = predictor.next(codes & 15);
                *(to += channels_) = predictor.next(codes >> 4);
            }
    }
    return true;
}

} // namespace platform::ffmpeg
