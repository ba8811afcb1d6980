#include "media/ffmpeg/FFmpegCodec.h"

#include "media/containers/AudioHandle.h"
#include "media/ffmpeg/CodingNames.h"
#include "media/ffmpeg/FLACChecksum.h"
#include "platform/core/Status.h"

#include <new>
#include <span>
#include <utility>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavcodec/codec_desc.h>
}

namespace platform::ffmpeg {

namespace {

constexpr int kAllChecked = AV_EF_CRCCHECK | AV_EF_EXPLODE;

/// The accurate decoder where there are several. Layers I to III: to floats, because integers are dithered, differently
/// after every seek. Others: the libraries of the codings' authors, since FFmpeg's own Opus decoder is off by up to -33
/// dB, that for GSM wraps instead of clipping, and that for Speex omits the enhancement.
const char* preferredDecoder(AVCodecID coding)
{
    switch (coding) {
    case AV_CODEC_ID_MP1:
        return "mp1float";
    case AV_CODEC_ID_MP2:
        return "mp2float";
    case AV_CODEC_ID_MP3:
        return "mp3float";
    case AV_CODEC_ID_OPUS:
        return "libopus";
    case AV_CODEC_ID_GSM:
        return "libgsm";
    case AV_CODEC_ID_GSM_MS:
        return "libgsm_ms";
    case AV_CODEC_ID_SPEEX:
        return "libspeex";
    default:
        return "";
    }
}

const AVCodec* decoderOf(AVCodecID coding)
{
    const AVCodec* const preferred = avcodec_find_decoder_by_name(preferredDecoder(coding));
    return preferred != nullptr ? preferred : avcodec_find_decoder(coding);
}

bool isLossless(AVCodecID coding)
{
    const AVCodecDescriptor* descriptor = avcodec_descriptor_get(coding);
    return descriptor != nullptr && (descriptor->props & AV_CODEC_PROP_LOSSLESS) != 0;
}

} // namespace

std::unique_ptr<Codec> FFmpegCodec::open(const AVCodecParameters& parameters, int numerator, int denominator,
                                         Padding padding, std::int32_t& status)
{
    status = AudioHandle::kFormatNotSupported;
    const AVCodec* codec = decoderOf(parameters.codec_id);
    if (codec == nullptr)
        return nullptr;
    CodecContext context(avcodec_alloc_context3(codec));
    if (!context || avcodec_parameters_to_context(context.get(), &parameters) == AVERROR(ENOMEM))
        throw std::bad_alloc();
    context->thread_count = 1;
    context->pkt_timebase = {numerator, denominator};
    context->log_level_offset = kLogLevelOffset;
    if (parameters.codec_id == AV_CODEC_ID_OPUS)
        context->request_sample_fmt = AV_SAMPLE_FMT_FLT; // otherwise libopus rounds to 16 bits
    if (isLossless(parameters.codec_id))
        context->err_recognition = AV_EF_CRCCHECK | AV_EF_EXPLODE; // damaged data is no sound
    if (padding == Padding::kept)
        context->flags2 |= AV_CODEC_FLAG2_SKIP_MANUAL;
    if (avcodec_open2(context.get(), codec, nullptr) < 0)
        return nullptr;
    status = kStatusOK;
    return std::unique_ptr<Codec>(new FFmpegCodec(std::move(context)));
}

FFmpegCodec::FFmpegCodec(CodecContext context) : context_(std::move(context)), frame_(makeFrame())
{
}

int FFmpegCodec::sourceBits() const
{
    return context_->bits_per_raw_sample;
}

CodingProfile FFmpegCodec::profile() const
{
    return profileOf(context_->codec_id, context_->profile);
}

bool FFmpegCodec::decodesDSD() const
{
    return isDSD(context_->codec_id);
}

Codec::Result FFmpegCodec::receive()
{
    switch (avcodec_receive_frame(context_.get(), frame_.get())) {
    case 0:
        return Result::frame;
    case AVERROR(EAGAIN):
        return Result::needsPacket;
    case AVERROR_EOF:
        return Result::end;
    default:
        return Result::failed;
    }
}

Codec::Sent FFmpegCodec::send(const AVPacket* packet)
{
    // What is proven here takes a tenth of the time that the decoder takes for it; whatever is not so is for that to
    // judge.
    if (context_->codec_id == AV_CODEC_ID_FLAC && packet != nullptr)
        context_->err_recognition =
            flacCRC16(std::as_bytes(std::span(packet->data, static_cast<std::size_t>(packet->size)))) == 0
                ? AV_EF_EXPLODE
                : kAllChecked;
    const int result = avcodec_send_packet(context_.get(), packet);
    return result == AVERROR(ENOMEM)             ? Sent::outOfMemory
           : result < 0 && result != AVERROR_EOF ? Sent::failed
                                                 : Sent::taken;
}

void FFmpegCodec::flush()
{
    avcodec_flush_buffers(context_.get());
}

} // namespace platform::ffmpeg
