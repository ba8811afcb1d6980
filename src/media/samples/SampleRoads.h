// The fast roads over samples, for processors with AVX2, AVX-512 or NEON. Their results are those of the plain roads,
// to the bit.
#pragma once

#include "media/samples/SampleExtremes.h"

namespace platform {

/// Whether this processor can take them; nothing else here is to be called where it cannot.
bool hasFastRoads();

/// Both go as far as whole vectors go and return the number of samples converted, from the first on; at most `count`.
std::size_t samplesToFloatFast(const void* samples, SampleFormat format, float* to, std::size_t count);
std::size_t floatToSamplesFast(const float* from, SampleFormat format, void* samples, std::size_t count);

void sampleExtremesFast(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to);

/// The same in vectors twice as wide, those of AVX-512. Conversions gain little by them.
bool hasWiderRoads();
void sampleExtremesWider(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                         SampleExtremes* to);

} // namespace platform
