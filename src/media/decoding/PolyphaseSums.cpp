#include "media/decoding/PolyphaseSums.h"

#include "media/samples/SampleRoads.h"
#include "media/samples/SampleVectors.h"

#include <array>

#if defined(KT_AVX2)
#include <immintrin.h>
#endif

namespace platform {

namespace {

constexpr std::size_t kSideBySide = PolyphaseRun::kSideBySide;

float sumOf(const float* filter, const float* samples, std::size_t taps)
{
    std::array<float, kSideBySide> sums{};
    for (std::size_t i = 0; i < taps; i += kSideBySide)
        for (std::size_t k = 0; k < kSideBySide; ++k)
            sums[k] += filter[i + k] * samples[i + k];
    for (std::size_t half = kSideBySide / 2; half > 0; half /= 2)
        for (std::size_t k = 0; k < half; ++k)
            sums[k] += sums[k + half];
    return sums[0];
}

#if defined(KT_AVX2)

/// The sixteen partial sums of a channel.
struct Sums {
    __m256 low, high;
};

KT_VECTORS inline void add(Sums& sums, __m256 filterLow, __m256 filterHigh, const float* samples)
{
    sums.low = _mm256_add_ps(sums.low, _mm256_mul_ps(filterLow, _mm256_loadu_ps(samples)));
    sums.high = _mm256_add_ps(sums.high, _mm256_mul_ps(filterHigh, _mm256_loadu_ps(samples + 8)));
}

KT_VECTORS inline float total(const Sums& sums)
{
    const __m256 eight = _mm256_add_ps(sums.low, sums.high);
    const __m128 four = _mm_add_ps(_mm256_castps256_ps128(eight), _mm256_extractf128_ps(eight, 1));
    const __m128 two = _mm_add_ps(four, _mm_movehl_ps(four, four));
    return _mm_cvtss_f32(_mm_add_ss(two, _mm_shuffle_ps(two, two, 1)));
}

#endif

} // namespace

void runPolyphasePlain(PolyphaseRun run)
{
    for (std::size_t frame = 0; frame < run.frames; ++frame, run.next())
        for (std::size_t channel = 0; channel < run.channels; ++channel)
            *run.to++ = sumOf(run.filters + run.phase * run.taps, run.samples + channel * run.stride, run.taps);
}

#if defined(KT_AVX2)

/// Processes channels in pairs, which share loaded coefficients.
KT_VECTORS void runPolyphaseFast(PolyphaseRun run)
{
    for (std::size_t frame = 0; frame < run.frames; ++frame, run.next()) {
        const float* const filter = run.filters + run.phase * run.taps;
        for (std::size_t channel = 0; channel < run.channels; channel += 2) {
            const float* const a = run.samples + channel * run.stride;
            const bool isPair = channel + 1 < run.channels;
            const float* const b = isPair ? a + run.stride : a;
            Sums ofA{_mm256_setzero_ps(), _mm256_setzero_ps()}, ofB = ofA;
            for (std::size_t i = 0; i < run.taps; i += kSideBySide) {
                const __m256 low = _mm256_loadu_ps(filter + i), high = _mm256_loadu_ps(filter + i + 8);
                add(ofA, low, high, a + i);
                add(ofB, low, high, b + i);
            }
            *run.to++ = total(ofA);
            if (isPair)
                *run.to++ = total(ofB);
        }
    }
}

#endif

void runPolyphase(PolyphaseRun run)
{
#if defined(KT_AVX2)
    if (hasWiderRoads())
        return runPolyphaseWider(run);
    if (hasFastRoads())
        return runPolyphaseFast(run);
#endif
    runPolyphasePlain(run);
}

} // namespace platform
