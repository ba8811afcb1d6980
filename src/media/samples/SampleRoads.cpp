#include "media/samples/SampleRoads.h"

#include "media/samples/SampleVectors.h"

namespace platform {

#if defined(KT_AVX2)

bool hasFastRoads()
{
    static const bool hasAVX2 = [] {
        __builtin_cpu_init(); // this may run before the constructor that does it
        return __builtin_cpu_supports("avx2") != 0;
    }();
    return hasAVX2;
}

#elif defined(KT_NEON)

bool hasFastRoads()
{
    return true; // all processors of this architecture have it
}

#else

bool hasFastRoads()
{
    return false;
}

std::size_t samplesToFloatFast(const void*, SampleFormat, float*, std::size_t)
{
    return 0;
}

std::size_t floatToSamplesFast(const float*, SampleFormat, void*, std::size_t)
{
    return 0;
}

void sampleExtremesFast(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to)
{
    sampleExtremesPlain(samples, format, samplesPerRun, runs, to);
}

#endif

#if !defined(KT_AVX2)

bool hasWiderRoads()
{
    return false;
}

void sampleExtremesWider(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                         SampleExtremes* to)
{
    sampleExtremesFast(samples, format, samplesPerRun, runs, to);
}

#endif

} // namespace platform
