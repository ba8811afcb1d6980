// The fast road of sampleExtremes, for processors with AVX2 (hasAVX2). Gives what the plain road gives, to the bit.
#pragma once

#include "media/samples/SampleExtremes.h"

namespace platform {

void sampleExtremesAVX2(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to);

} // namespace platform
