#include "platform/ffmpeg/Codec.h"

#include "platform/ffmpeg/FFmpegCodec.h"
#include "platform/ffmpeg/WavPackCodec.h"

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace platform::ffmpeg {

std::unique_ptr<Codec> Codec::open(const AVCodecParameters& parameters, int numerator, int denominator, Padding padding,
                                   std::int32_t& status)
{
    // FFmpeg 5.1 gives up on blocks of ordinary files.
    const auto openCodec = parameters.codec_id == AV_CODEC_ID_WAVPACK ? WavPackCodec::open : FFmpegCodec::open;
    return openCodec(parameters, numerator, denominator, padding, status);
}

} // namespace platform::ffmpeg
