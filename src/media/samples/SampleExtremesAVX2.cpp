// Compares samples as they are stored, in vectors of their own width, and converts only the extremes of a run to
// floats. Conversion preserves order, rounding included, so the result is the same as converting first.
#include "media/samples/SampleExtremesAVX2.h"

#if defined(KT_AVX2)

#include "media/samples/SampleKinds.h"
#include "media/samples/SampleRoads.h"
#include "media/samples/SampleVectorRoads.h"

namespace platform {

void sampleExtremesFast(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to)
{
    using namespace avx2;
    roadOf<VectorExtremes, Integers, Floats, Doubles>(format)(samples, format, samplesPerRun, runs, to);
}

} // namespace platform

#endif
