// Sample rate conversion by libswresample.
#pragma once

#include "media/decoding/Resampler.h"

#include <memory>

namespace platform::ffmpeg {

/// As DecoderModule::makeResampler: kFormatNotSupported for rates and channels beyond Resampler's, for two equal rates,
/// and for rates so far apart, or so odd a ratio, that the filter would be larger than 64 MiB.
std::unique_ptr<Resampler> makeRateConverter(std::uint32_t channels, std::uint32_t fromRate, std::uint32_t toRate,
                                             std::int32_t& status);

} // namespace platform::ffmpeg
