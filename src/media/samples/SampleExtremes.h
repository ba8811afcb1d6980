// The lowest and highest of stored samples, from which a picture of them is made.
#pragma once

#include "media/samples/SampleConversion.h"

#include <cstddef>

namespace platform {

/// The extremes of a run of samples, apart for even and odd places: for stereo, left and right. Zero always counts
/// among them. A sample is the float that samplesToFloat makes of it; a NaN does not count.
struct SampleExtremes {
    float lowest[2] = {0, 0};  // at most 0
    float highest[2] = {0, 0}; // at least 0
};

/// The extremes of `runs` consecutive runs of `samplesPerRun` samples each, written to `to`. `samples` needs no
/// alignment. The format must be supported.
KT_EXPORT void sampleExtremes(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                              SampleExtremes* to);

/// The same without vector instructions, which the fast one must equal.
KT_EXPORT void sampleExtremesPlain(const void* samples, SampleFormat format, std::size_t samplesPerRun,
                                   std::size_t runs, SampleExtremes* to);

} // namespace platform
