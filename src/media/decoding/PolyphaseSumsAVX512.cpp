#include "media/decoding/PolyphaseSums.h"
#include "media/samples/SampleVectors.h"

#if defined(KT_AVX2)

#include <immintrin.h>

#define KT_WIDE_VECTORS __attribute__((target("avx512f,avx512dq")))

namespace platform {

namespace {

static_assert(PolyphaseRun::kSideBySide == sizeof(__m512) / sizeof(float));

/// The totals of two channels, added in the plain road's order, in the lowest elements of both halves.
KT_WIDE_VECTORS inline __m256 totals(__m512 a, __m512 b)
{
    const __m512 fourths = _mm512_add_ps(_mm512_shuffle_f32x4(a, b, 0x44), _mm512_shuffle_f32x4(a, b, 0xEE));
    const __m256 fours = _mm256_add_ps(_mm512_castps512_ps256(_mm512_shuffle_f32x4(fourths, fourths, 0x08)),
                                       _mm512_castps512_ps256(_mm512_shuffle_f32x4(fourths, fourths, 0x0D)));
    const __m256 twos = _mm256_add_ps(fours, _mm256_permute_ps(fours, 0x4E));
    return _mm256_add_ps(twos, _mm256_permute_ps(twos, 0xB1));
}

} // namespace

/// Processes channels in pairs, which share loaded coefficients.
KT_WIDE_VECTORS void runPolyphaseWider(PolyphaseRun run)
{
    for (std::size_t frame = 0; frame < run.frames; ++frame, run.next()) {
        const float* const filter = run.filters + run.phase * run.taps;
        for (std::size_t channel = 0; channel < run.channels; channel += 2) {
            const float* const a = run.samples + channel * run.stride;
            const bool isPair = channel + 1 < run.channels;
            const float* const b = isPair ? a + run.stride : a;
            __m512 ofA = _mm512_setzero_ps(), ofB = ofA;
            for (std::size_t i = 0; i < run.taps; i += PolyphaseRun::kSideBySide) {
                const __m512 coefficients = _mm512_loadu_ps(filter + i);
                ofA = _mm512_add_ps(ofA, _mm512_mul_ps(coefficients, _mm512_loadu_ps(a + i)));
                ofB = _mm512_add_ps(ofB, _mm512_mul_ps(coefficients, _mm512_loadu_ps(b + i)));
            }
            const __m256 sums = totals(ofA, ofB);
            *run.to++ = _mm256_cvtss_f32(sums);
            if (isPair)
                *run.to++ = _mm_cvtss_f32(_mm256_extractf128_ps(sums, 1));
        }
    }
}

} // namespace platform

#endif
