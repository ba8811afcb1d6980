// The lowest and the highest of samples as they stand in files: what a picture of them is made of.
#pragma once

#include "media/samples/SampleConversion.h"

#include <cstddef>

namespace platform {

/// Of a run of samples, those at even places and those at odd places apart: of stereo, left and right. Zero counts as
/// one of each. A sample is the float that samplesToFloat makes of it; a NaN counts as nothing.
struct SampleExtremes {
    float lowest[2] = {0, 0};
    float highest[2] = {0, 0};
};

/// The extremes of `runs` runs that follow each other, each of `samplesPerRun` samples, to `to`. `samples` needs no
/// alignment. The format must be supported.
KT_EXPORT void sampleExtremes(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                              SampleExtremes* to);

/// The plain road, without vector instructions: what the fast one is proven equal to.
KT_EXPORT void sampleExtremesPlain(const void* samples, SampleFormat format, std::size_t samplesPerRun,
                                   std::size_t runs, SampleExtremes* to);

} // namespace platform
