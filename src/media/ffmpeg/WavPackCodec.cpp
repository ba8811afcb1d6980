#include "media/ffmpeg/WavPackCodec.h"

#include "media/ffmpeg/FFmpegCodec.h"

#include <algorithm>
#include <bit>
#include <cstdio>
#include <cstring>
#include <new>
#include <utility>
#include <vector>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/channel_layout.h>
#include <wavpack/wavpack.h>
}

namespace platform::ffmpeg {

namespace {

/// Presents a packet to libwavpack as a file.
struct Blocks {
    const std::uint8_t* data;
    std::int64_t size, at = 0;

    static Blocks& of(void* id) { return *static_cast<Blocks*>(id); }
    int moveTo(std::int64_t place)
    {
        if (place < 0 || place > size)
            return -1;
        at = place;
        return 0;
    }
};

WavpackStreamReader64 blocksReader = {
    .read_bytes = [](void* id, void* to, std::int32_t count) -> std::int32_t {
        Blocks& blocks = Blocks::of(id);
        const std::int64_t there = std::clamp<std::int64_t>(count, 0, blocks.size - blocks.at);
        std::memcpy(to, blocks.data + blocks.at, static_cast<std::size_t>(there));
        blocks.at += there;
        return static_cast<std::int32_t>(there);
    },
    .write_bytes = nullptr,
    .get_pos = [](void* id) { return Blocks::of(id).at; },
    .set_pos_abs = [](void* id, std::int64_t place) { return Blocks::of(id).moveTo(place); },
    .set_pos_rel =
        [](void* id, std::int64_t delta, int mode) {
            Blocks& blocks = Blocks::of(id);
            return blocks.moveTo((mode == SEEK_SET ? 0 : mode == SEEK_CUR ? blocks.at : blocks.size) + delta);
        },
    .push_back_byte =
        [](void* id, int byte) {
            Blocks& blocks = Blocks::of(id);
            return blocks.moveTo(blocks.at - 1) == 0 ? byte : EOF;
        },
    .get_length = [](void* id) { return Blocks::of(id).size; },
    .can_seek = [](void*) { return 0; },
    .truncate_here = nullptr,
    .close = nullptr,
};

struct Close {
    void operator()(WavpackContext* context) const { WavpackCloseFile(context); }
};
using Context = std::unique_ptr<WavpackContext, Close>;

/// Converts samples that are right-aligned in 32 bits to as many bytes as they need.
template <class Sample>
void place(const std::vector<std::int32_t>& samples, int bytes, std::uint8_t* to)
{
    const int shift = static_cast<int>(sizeof(Sample)) * 8 - bytes * 8;
    auto* const out = reinterpret_cast<Sample*>(to);
    for (std::size_t i = 0; i < samples.size(); ++i)
        out[i] = static_cast<Sample>(static_cast<std::uint32_t>(samples[i]) << shift);
}

} // namespace

std::unique_ptr<Codec> WavPackCodec::open(const AVCodecParameters& parameters, int numerator, int denominator,
                                          Padding padding, std::int32_t& status)
{
    std::unique_ptr<Codec> ofDSD = FFmpegCodec::open(parameters, numerator, denominator, padding, status);
    return ofDSD ? std::unique_ptr<Codec>(new WavPackCodec(std::move(ofDSD))) : nullptr;
}

WavPackCodec::WavPackCodec(std::unique_ptr<Codec> ofDSD)
    : ofDSD_(std::move(ofDSD)),
      packet_(makePacket()),
      frame_(makeFrame())
{
}

const AVFrame& WavPackCodec::frame() const
{
    return isDSD_ ? ofDSD_->frame() : *frame_;
}

int WavPackCodec::sourceBits() const
{
    return isDSD_ ? ofDSD_->sourceBits() : sourceBits_;
}

void WavPackCodec::flush()
{
    ofDSD_->flush();
    av_packet_unref(packet_.get());
    isEnd_ = false;
}

Codec::Sent WavPackCodec::send(const AVPacket* packet)
{
    constexpr int flagsAt = 24; // offset in the block's header, little-endian
    constexpr std::uint8_t dsd = 0x80;
    if (packet != nullptr && packet->size >= 32)
        isDSD_ = (packet->data[flagsAt + 3] & dsd) != 0;
    if (isDSD_)
        return ofDSD_->send(packet);
    isEnd_ = packet == nullptr;
    av_packet_unref(packet_.get());
    return isEnd_ || av_packet_ref(packet_.get(), packet) == 0 ? Sent::taken : Sent::outOfMemory;
}

Codec::Result WavPackCodec::receive()
{
    if (isDSD_)
        return ofDSD_->receive();
    if (packet_->size == 0)
        return isEnd_ ? Result::end : Result::needsPacket;
    const bool isDecoded = decode();
    av_packet_unref(packet_.get());
    return isDecoded ? Result::frame : Result::failed;
}

/// FFmpeg makes the headers in Matroska itself; they state no total number of frames, and block checksums do not cover
/// them. The samples have a checksum of their own.
bool WavPackCodec::takeHeader()
{
    constexpr std::size_t total = 12, size = 4;
    if (packet_->size < 32 ||
        std::any_of(packet_->data + total, packet_->data + total + size, [](std::uint8_t byte) { return byte != 0; }))
        return true;
    if (av_packet_make_writable(packet_.get()) < 0)
        throw std::bad_alloc();
    std::memset(packet_->data + total, 0xFF, size); // unknown
    return false;
}

bool WavPackCodec::decode()
{
    // libwavpack writes blocks of at most 131,072 frames.
    constexpr std::uint32_t mostFrames = 1u << 20, mostChannels = 256;
    char error[81] = {};
    const bool hasOwnHeader = takeHeader();
    Blocks blocks{packet_->data, packet_->size};
    const AVBufferRef* const correction = packet_->opaque_ref; // set by CorrectionFile
    Blocks corrections{correction != nullptr ? correction->data : nullptr,
                       correction != nullptr ? static_cast<std::int64_t>(correction->size) : 0};
    const int flags = OPEN_STREAMING | OPEN_NORMALIZE | (hasOwnHeader ? 0 : OPEN_NO_CHECKSUM) |
                      (correction != nullptr ? OPEN_WVC : 0);
    const Context context(WavpackOpenFileInputEx64(&blocksReader, &blocks,
                                                   correction != nullptr ? &corrections : nullptr, error, flags, 0));
    if (!context)
        return false;
    const std::uint32_t frames = WavpackGetNumSamplesInFrame(context.get());
    const auto channels = static_cast<std::uint32_t>(WavpackGetNumChannels(context.get()));
    const int bytes = WavpackGetBytesPerSample(context.get());
    if (frames == 0 || frames > mostFrames || channels == 0 || channels > mostChannels || bytes < 1 || bytes > 4)
        return false;
    std::vector<std::int32_t> samples(std::size_t{frames} * channels);
    if (WavpackUnpackSamples(context.get(), samples.data(), frames) != frames ||
        WavpackGetNumErrors(context.get()) != 0)
        return false;
    const bool isFloat = (WavpackGetMode(context.get()) & MODE_FLOAT) != 0;
    sourceBits_ = isFloat ? 32 : WavpackGetBitsPerSample(context.get());
    AVFrame& frame = *frame_;
    av_frame_unref(&frame);
    frame.format = isFloat ? AV_SAMPLE_FMT_FLT : bytes <= 2 ? AV_SAMPLE_FMT_S16 : AV_SAMPLE_FMT_S32;
    frame.nb_samples = static_cast<int>(frames);
    frame.sample_rate = static_cast<int>(std::min(WavpackGetSampleRate(context.get()), 1u << 24));
    const auto mask = static_cast<std::uint32_t>(WavpackGetChannelMask(context.get()));
    if (std::popcount(mask) != static_cast<int>(channels) || av_channel_layout_from_mask(&frame.ch_layout, mask) < 0) {
        frame.ch_layout.order = AV_CHANNEL_ORDER_UNSPEC;
        frame.ch_layout.nb_channels = static_cast<int>(channels);
    }
    frame.pts = packet_->pts;
    frame.pkt_duration = packet_->duration;
    if (av_frame_get_buffer(&frame, 0) < 0)
        throw std::bad_alloc();
    if (bytes <= 2 && !isFloat)
        place<std::int16_t>(samples, bytes, frame.data[0]);
    else
        place<std::int32_t>(samples, isFloat ? 4 : bytes, frame.data[0]);
    return true;
}

} // namespace platform::ffmpeg
