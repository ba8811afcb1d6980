// The fast roads of the sample conversions, for processors with AVX2. They go as far as whole vectors go, and leave the
// rest to the plain roads, whose results they give to the bit.
#pragma once

#include "media/samples/SampleConversion.h"

namespace platform {

/// Whether this processor can take them.
bool hasAVX2();
/// Both return the number of samples converted, from the first on; at most `count`.
std::size_t samplesToFloatAVX2(const void* samples, SampleFormat format, float* to, std::size_t count);
std::size_t floatToSamplesAVX2(const float* from, SampleFormat format, void* samples, std::size_t count);

} // namespace platform
