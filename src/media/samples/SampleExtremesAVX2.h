// Extremes in AVX2 vectors, to which AVX-512 vectors are reduced too. For their .cpp files only.
#pragma once

#include "media/samples/SampleLanesAVX2.h"

#if defined(KT_AVX2)

#include <cstdint>

namespace platform::avx2 {

// The sample kinds; their pairs are the two lower floats. Zeros that a shift brings in do no harm, because zero always
// counts.
struct Pairs {
    KT_VECTORS static inline void store(float* to, __m128 first, __m128 second)
    {
        _mm_storeu_ps(to, _mm_movelh_ps(first, second));
    }
};

// Integers of `Bits` bits per lane; 24-bit samples have 32-bit lanes.
template <int Bits>
struct IntegerLanes : Pairs {
    using Vector = __m256i;

    KT_VECTORS static inline Vector zero() { return _mm256_setzero_si256(); }
    KT_VECTORS static inline Vector lower(Vector a, Vector b)
    {
        if constexpr (Bits == 8)
            return _mm256_min_epi8(a, b);
        else if constexpr (Bits == 16)
            return _mm256_min_epi16(a, b);
        else
            return _mm256_min_epi32(a, b);
    }
    KT_VECTORS static inline Vector higher(Vector a, Vector b)
    {
        if constexpr (Bits == 8)
            return _mm256_max_epi8(a, b);
        else if constexpr (Bits == 16)
            return _mm256_max_epi16(a, b);
        else
            return _mm256_max_epi32(a, b);
    }
    template <Vector (*Choose)(Vector, Vector)>
    KT_VECTORS static inline __m128 evenAndOdd(Vector value)
    {
        constexpr float scale = 1.0F / static_cast<float>(std::uint32_t{1} << (Bits - 1));
        value = Choose(value, _mm256_permute4x64_epi64(value, 0b01'00'11'10));
        value = Choose(value, _mm256_srli_si256(value, 8));
        if constexpr (Bits < 32)
            value = Choose(value, _mm256_srli_si256(value, 4));
        if constexpr (Bits < 16)
            value = Choose(value, _mm256_srli_si256(value, 2));
        const __m128i pair = _mm256_castsi256_si128(value);
        const __m128i wide = Bits == 8 ? _mm_cvtepi8_epi32(pair) : Bits == 16 ? _mm_cvtepi16_epi32(pair) : pair;
        return _mm_mul_ps(_mm_cvtepi32_ps(wide), _mm_set1_ps(scale));
    }
};

template <int Bytes, bool Big, bool Unsigned>
struct Integers : IntegerLanes<Bytes == 3 ? 32 : 8 * Bytes> {
    static constexpr std::size_t size = Bytes;
    static constexpr std::size_t step = Bytes == 3 ? 8 : 32 / Bytes;

    KT_VECTORS static inline __m256i load(const Byte* from)
    {
        if constexpr (Bytes == 1)
            return Unsigned ? _mm256_xor_si256(load32(from), _mm256_set1_epi8(-128)) : load32(from);
        else if constexpr (Bytes == 2)
            return Big ? swap2(load32(from)) : load32(from);
        else if constexpr (Bytes == 3)
            return load24<Big>(from);
        else
            return Big ? swap4(load32(from)) : load32(from);
    }
};

// Given a NaN and a number, `lower` and `higher` return their second argument.
template <bool Big>
struct Floats : Pairs {
    using Vector = __m256;
    static constexpr std::size_t size = 4;
    static constexpr std::size_t step = 8;

    KT_VECTORS static inline Vector zero() { return _mm256_setzero_ps(); }
    KT_VECTORS static inline Vector load(const Byte* from)
    {
        return _mm256_castsi256_ps(Big ? swap4(load32(from)) : load32(from));
    }
    KT_VECTORS static inline Vector lower(Vector a, Vector b) { return _mm256_min_ps(a, b); }
    KT_VECTORS static inline Vector higher(Vector a, Vector b) { return _mm256_max_ps(a, b); }
    template <Vector (*Choose)(Vector, Vector)>
    KT_VECTORS static inline __m128 evenAndOdd(Vector value)
    {
        value = Choose(value, _mm256_permute2f128_ps(value, value, 1));
        value = Choose(value, _mm256_permute_ps(value, 0b01'00'11'10));
        return _mm256_castps256_ps128(value);
    }
};

template <bool Big>
struct Doubles : Pairs {
    using Vector = __m256d;
    static constexpr std::size_t size = 8;
    static constexpr std::size_t step = 4;

    KT_VECTORS static inline Vector zero() { return _mm256_setzero_pd(); }
    KT_VECTORS static inline Vector load(const Byte* from)
    {
        return _mm256_castsi256_pd(Big ? swap8(load32(from)) : load32(from));
    }
    KT_VECTORS static inline Vector lower(Vector a, Vector b) { return _mm256_min_pd(a, b); }
    KT_VECTORS static inline Vector higher(Vector a, Vector b) { return _mm256_max_pd(a, b); }
    template <Vector (*Choose)(Vector, Vector)>
    KT_VECTORS static inline __m128 evenAndOdd(Vector value)
    {
        return _mm256_cvtpd_ps(Choose(value, _mm256_permute2f128_pd(value, value, 1)));
    }
};

} // namespace platform::avx2

#endif
