// The fast roads over samples, for processors with AVX2, AVX-512 or NEON. Their results equal those of the plain roads
// to the bit.
#pragma once

#include "media/samples/SampleExtremes.h"

namespace platform {

/// Whether this processor supports them; nothing else here may be called if it does not.
bool hasFastRoads();

/// Both convert whole vectors only, from the first sample on, and return the number of samples converted, at most
/// `count`.
std::size_t samplesToFloatFast(const void* samples, SampleFormat format, float* to, std::size_t count);
std::size_t floatToSamplesFast(const float* from, SampleFormat format, void* samples, std::size_t count);

void sampleExtremesFast(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to);

/// As above with AVX-512, in vectors twice as wide. Conversions gain little from them.
bool hasWiderRoads();
void sampleExtremesWider(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                         SampleExtremes* to);

} // namespace platform
