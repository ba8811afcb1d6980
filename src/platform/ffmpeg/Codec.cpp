#include "platform/ffmpeg/Codec.h"

#include "platform/AudioHandle.h"
#include "platform/core/Status.h"

#include <new>

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace platform::ffmpeg {

namespace {

/// The first that there is, but floats for layers I and II: integers are dithered, differently after every seek.
const AVCodec* decoderOf(AVCodecID coding)
{
    const AVCodec* const exact = coding == AV_CODEC_ID_MP1   ? avcodec_find_decoder_by_name("mp1float")
                                 : coding == AV_CODEC_ID_MP2 ? avcodec_find_decoder_by_name("mp2float")
                                 : coding == AV_CODEC_ID_MP3 ? avcodec_find_decoder_by_name("mp3float")
                                                             : nullptr;
    return exact != nullptr ? exact : avcodec_find_decoder(coding);
}

} // namespace

Codec::Codec(const AVCodecParameters& parameters, int numerator, int denominator, Padding padding, std::int32_t& status)
    : frame_(makeFrame())
{
    status = AudioHandle::kFormatNotSupported;
    const AVCodec* codec = decoderOf(parameters.codec_id);
    if (codec == nullptr)
        return;
    CodecContext context(avcodec_alloc_context3(codec));
    if (!context || avcodec_parameters_to_context(context.get(), &parameters) == AVERROR(ENOMEM))
        throw std::bad_alloc();
    context->thread_count = 1;
    context->pkt_timebase = {numerator, denominator};
    context->log_level_offset = 1000; // beyond every level: a host may show what its own decoders say
    if (padding == Padding::kept)
        context->flags2 |= AV_CODEC_FLAG2_SKIP_MANUAL;
    if (avcodec_open2(context.get(), codec, nullptr) < 0)
        return;
    context_ = std::move(context);
    status = kStatusOK;
}

Codec::Result Codec::receive()
{
    const int result = avcodec_receive_frame(context_.get(), frame_.get());
    return result == 0                 ? Result::frame
           : result == AVERROR(EAGAIN) ? Result::needsPacket
           : result == AVERROR_EOF     ? Result::end
                                       : Result::failed;
}

bool Codec::send(const AVPacket* packet)
{
    return avcodec_send_packet(context_.get(), packet) != AVERROR(ENOMEM);
}

void Codec::flush()
{
    avcodec_flush_buffers(context_.get());
}

} // namespace platform::ffmpeg
