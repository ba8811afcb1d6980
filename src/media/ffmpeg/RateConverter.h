// Sample rate conversion by libswresample.
#pragma once

#include "media/decoding/Resampler.h"

#include <memory>

namespace platform::ffmpeg {

/// As DecoderModule::makeResampler. kFormatNotSupported beyond Resampler's limits, for equal rates, and if the ratio is
/// so large or so odd that the filter would exceed 64 MiB.
std::unique_ptr<Resampler> makeRateConverter(std::uint32_t channels, std::uint32_t fromRate, std::uint32_t toRate,
                                             std::int32_t& status);

} // namespace platform::ffmpeg
