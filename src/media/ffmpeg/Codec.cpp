#include "media/ffmpeg/Codec.h"

#include "media/ffmpeg/FFmpegCodec.h"
#include "media/ffmpeg/IMACodec.h"
#include "media/ffmpeg/WavPackCodec.h"
#include "platform/core/Status.h"

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace platform::ffmpeg {

std::unique_ptr<Codec> Codec::open(const AVCodecParameters& parameters, int numerator, int denominator, Padding padding,
                                   std::int32_t& status)
{
    if (parameters.codec_id == AV_CODEC_ID_ADPCM_IMA_WAV)
        if (std::unique_ptr<Codec> codec = IMACodec::open(parameters)) {
            status = kStatusOK;
            return codec;
        }
    // FFmpeg 5.1 fails on blocks of ordinary WavPack files.
    const auto openCodec = parameters.codec_id == AV_CODEC_ID_WAVPACK ? WavPackCodec::open : FFmpegCodec::open;
    return openCodec(parameters, numerator, denominator, padding, status);
}

} // namespace platform::ffmpeg
