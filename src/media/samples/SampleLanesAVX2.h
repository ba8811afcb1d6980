// Loads samples into vector lanes, for the fast roads with AVX2. For their .cpp files only.
#pragma once

#include "media/samples/SampleVectors.h"

#if defined(KT_AVX2)

#include <cstddef>
#include <immintrin.h>

namespace platform::avx2 {

using Byte = unsigned char;

KT_VECTORS inline __m128i load16(const Byte* from)
{
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}

KT_VECTORS inline __m256i load32(const Byte* from)
{
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
}

KT_VECTORS inline __m128i swap2(__m128i value)
{
    return _mm_shuffle_epi8(value, _mm_setr_epi8(1, 0, 3, 2, 5, 4, 7, 6, 9, 8, 11, 10, 13, 12, 15, 14));
}

KT_VECTORS inline __m256i swap2(__m256i value)
{
    return _mm256_shuffle_epi8(
        value, _mm256_broadcastsi128_si256(_mm_setr_epi8(1, 0, 3, 2, 5, 4, 7, 6, 9, 8, 11, 10, 13, 12, 15, 14)));
}

KT_VECTORS inline __m256i swap4(__m256i value)
{
    return _mm256_shuffle_epi8(
        value, _mm256_broadcastsi128_si256(_mm_setr_epi8(3, 2, 1, 0, 7, 6, 5, 4, 11, 10, 9, 8, 15, 14, 13, 12)));
}

KT_VECTORS inline __m256i swap8(__m256i value)
{
    return _mm256_shuffle_epi8(
        value, _mm256_broadcastsi128_si256(_mm_setr_epi8(7, 6, 5, 4, 3, 2, 1, 0, 15, 14, 13, 12, 11, 10, 9, 8)));
}

/// Eight samples of 3 bytes, each in the upper bytes of a lane of 4.
template <bool Big>
KT_VECTORS inline __m256i load24(const Byte* from)
{
    // Two overlapping loads take the 24 bytes and none beyond.
    const __m256i bytes = _mm256_setr_m128i(load16(from), load16(from + 8));
    const __m256i little = _mm256_setr_epi8(-1, 0, 1, 2, -1, 3, 4, 5, -1, 6, 7, 8, -1, 9, 10, 11, //
                                            -1, 4, 5, 6, -1, 7, 8, 9, -1, 10, 11, 12, -1, 13, 14, 15);
    const __m256i big = _mm256_setr_epi8(-1, 2, 1, 0, -1, 5, 4, 3, -1, 8, 7, 6, -1, 11, 10, 9, //
                                         -1, 6, 5, 4, -1, 9, 8, 7, -1, 12, 11, 10, -1, 15, 14, 13);
    return _mm256_shuffle_epi8(bytes, Big ? big : little);
}

} // namespace platform::avx2

#endif
