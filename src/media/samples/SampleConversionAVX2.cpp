#include "media/samples/SampleLanesAVX2.h"

#if defined(KT_AVX2)

#include "media/samples/SampleKinds.h"
#include "media/samples/SampleRoads.h"
#include "media/samples/SampleVectorRoads.h"

namespace platform {
namespace {

using namespace avx2;

KT_VECTORS inline void store16(Byte* to, __m128i value)
{
    _mm_storeu_si128(reinterpret_cast<__m128i*>(to), value);
}

// Eight samples, left-aligned or not; `kScale` brings them to [-1, 1).
template <int Bytes, bool Big, bool Unsigned>
struct Integers {
    static constexpr std::size_t size = Bytes;
    // 24-bit samples are in the upper bytes of their lanes, where conversion is exact.
    static constexpr int laneBits = Bytes == 3 ? 32 : 8 * Bytes;
    static constexpr float scale = 1.0F / static_cast<float>(std::uint32_t{1} << (laneBits - 1));

    KT_VECTORS static inline __m256i lanes(const Byte* from)
    {
        if constexpr (Bytes == 1) {
            const __m128i bytes = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(from));
            return _mm256_cvtepi8_epi32(Unsigned ? _mm_xor_si128(bytes, _mm_set1_epi8(-128)) : bytes);
        } else if constexpr (Bytes == 2) {
            const __m128i words = load16(from);
            return _mm256_cvtepi16_epi32(Big ? swap2(words) : words);
        } else if constexpr (Bytes == 3) {
            return load24<Big>(from);
        } else {
            const __m256i words = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
            return Big ? swap4(words) : words;
        }
    }

    KT_VECTORS static inline void read(const Byte* from, float* to)
    {
        _mm256_storeu_ps(to, _mm256_mul_ps(_mm256_cvtepi32_ps(lanes(from)), _mm256_set1_ps(scale)));
    }

    // Eight integers, rounded half to even and clamped; a NaN becomes 0.
    KT_VECTORS static inline __m256i rounded(const float* from)
    {
        constexpr float full = static_cast<float>(std::uint32_t{1} << (8 * Bytes - 1));
        const __m256 samples = _mm256_mul_ps(_mm256_loadu_ps(from), _mm256_set1_ps(full));
        const __m256 numbers = _mm256_and_ps(samples, _mm256_cmp_ps(samples, samples, _CMP_ORD_Q));
        const __m256 above = _mm256_max_ps(numbers, _mm256_set1_ps(-full));
        if constexpr (Bytes < 4)
            return _mm256_cvtps_epi32(_mm256_min_ps(above, _mm256_set1_ps(full - 1)));
        // 2^31 - 1 is no float: a value that is too large converts to 0x80000000, whose complement is that number.
        const __m256 tooLarge = _mm256_cmp_ps(above, _mm256_set1_ps(full), _CMP_GE_OQ);
        return _mm256_xor_si256(_mm256_cvtps_epi32(above), _mm256_castps_si256(tooLarge));
    }

    KT_VECTORS static inline void write(Byte* to, const float* from)
    {
        const __m256i values = rounded(from);
        if constexpr (Bytes == 4) {
            _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), Big ? swap4(values) : values);
        } else if constexpr (Bytes == 3) {
            const __m128i little = _mm_setr_epi8(0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, -1, -1, -1, -1);
            const __m128i big = _mm_setr_epi8(2, 1, 0, 6, 5, 4, 10, 9, 8, 14, 13, 12, -1, -1, -1, -1);
            const __m256i packed = _mm256_shuffle_epi8(values, _mm256_broadcastsi128_si256(Big ? big : little));
            const __m128i second = _mm256_extracti128_si256(packed, 1);
            store16(to, _mm256_castsi256_si128(packed)); // the next store overwrites its last 4 bytes
            _mm_storel_epi64(reinterpret_cast<__m128i*>(to + 12), second);
            _mm_storeu_si32(to + 20, _mm_srli_si128(second, 8));
        } else {
            const __m128i words = _mm_packs_epi32(_mm256_castsi256_si128(values), _mm256_extracti128_si256(values, 1));
            if constexpr (Bytes == 2) {
                store16(to, Big ? swap2(words) : words);
            } else {
                const __m128i bytes = _mm_packs_epi16(words, words);
                _mm_storel_epi64(reinterpret_cast<__m128i*>(to),
                                 Unsigned ? _mm_xor_si128(bytes, _mm_set1_epi8(-128)) : bytes);
            }
        }
    }
};

template <bool Big>
struct Floats {
    static constexpr std::size_t size = 4;

    KT_VECTORS static inline void read(const Byte* from, float* to)
    {
        const __m256i words = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), Big ? swap4(words) : words);
    }

    KT_VECTORS static inline void write(Byte* to, const float* from)
    {
        const __m256i words = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), Big ? swap4(words) : words);
    }
};

template <bool Big>
struct Doubles {
    static constexpr std::size_t size = 8;

    KT_VECTORS static inline void read(const Byte* from, float* to)
    {
        for (std::size_t half = 0; half < 2; ++half) {
            const __m256i words = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from + 32 * half));
            _mm_storeu_ps(to + 4 * half, _mm256_cvtpd_ps(_mm256_castsi256_pd(Big ? swap8(words) : words)));
        }
    }

    KT_VECTORS static inline void write(Byte* to, const float* from)
    {
        for (std::size_t half = 0; half < 2; ++half) {
            const __m256i words = _mm256_castpd_si256(_mm256_cvtps_pd(_mm_loadu_ps(from + 4 * half)));
            _mm256_storeu_si256(reinterpret_cast<__m256i*>(to + 32 * half), Big ? swap8(words) : words);
        }
    }
};

} // namespace

std::size_t samplesToFloatFast(const void* samples, SampleFormat format, float* to, std::size_t count)
{
    return roadOf<VectorReader, Integers, Floats, Doubles>(format)(samples, to, count);
}

std::size_t floatToSamplesFast(const float* from, SampleFormat format, void* samples, std::size_t count)
{
    return roadOf<VectorWriter, Integers, Floats, Doubles>(format)(from, samples, count);
}

} // namespace platform

#endif
