// Samples are compared as they are stored, in vectors of their own width, and only the extremes of a run become floats:
// that conversion keeps their order, rounding included, so the result is that of converting first.
#include "media/samples/SampleExtremesAVX2.h"

#if defined(__x86_64__)

#include "media/samples/SampleLanesAVX2.h"

#include <algorithm>

namespace platform {
namespace {

using namespace avx2;

// The formats: `Vector` holds `step` samples in the lanes, an even number of them; `evenAndOdd` brings a vector of
// extremes down to those of its even and of its odd lanes, as the two lower floats. Where that fills up with zeros it
// does no harm, as zero counts anyway.

// `Bits` of a lane; 24-bit samples stand in lanes of 32.
template <int Bits>
struct IntegerLanes {
    using Vector = __m256i;

    KT_AVX2 static inline Vector zero() { return _mm256_setzero_si256(); }
    KT_AVX2 static inline Vector lower(Vector a, Vector b)
    {
        if constexpr (Bits == 8)
            return _mm256_min_epi8(a, b);
        else if constexpr (Bits == 16)
            return _mm256_min_epi16(a, b);
        else
            return _mm256_min_epi32(a, b);
    }
    KT_AVX2 static inline Vector higher(Vector a, Vector b)
    {
        if constexpr (Bits == 8)
            return _mm256_max_epi8(a, b);
        else if constexpr (Bits == 16)
            return _mm256_max_epi16(a, b);
        else
            return _mm256_max_epi32(a, b);
    }
    template <Vector (*Choose)(Vector, Vector)>
    KT_AVX2 static inline __m128 evenAndOdd(Vector value)
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

template <int Bytes, bool Big, bool Unsigned = false>
struct Integers : IntegerLanes<Bytes == 3 ? 32 : 8 * Bytes> {
    static constexpr std::size_t size = Bytes;
    static constexpr std::size_t step = Bytes == 3 ? 8 : 32 / Bytes;

    KT_AVX2 static inline __m256i load(const Byte* from)
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

// Of a NaN and a number, `lower` and `higher` choose their second argument.
template <bool Big>
struct Floats {
    using Vector = __m256;
    static constexpr std::size_t size = 4;
    static constexpr std::size_t step = 8;

    KT_AVX2 static inline Vector zero() { return _mm256_setzero_ps(); }
    KT_AVX2 static inline Vector load(const Byte* from)
    {
        return _mm256_castsi256_ps(Big ? swap4(load32(from)) : load32(from));
    }
    KT_AVX2 static inline Vector lower(Vector a, Vector b) { return _mm256_min_ps(a, b); }
    KT_AVX2 static inline Vector higher(Vector a, Vector b) { return _mm256_max_ps(a, b); }
    template <Vector (*Choose)(Vector, Vector)>
    KT_AVX2 static inline __m128 evenAndOdd(Vector value)
    {
        value = Choose(value, _mm256_permute2f128_ps(value, value, 1));
        value = Choose(value, _mm256_permute_ps(value, 0b01'00'11'10));
        return _mm256_castps256_ps128(value);
    }
};

template <bool Big>
struct Doubles {
    using Vector = __m256d;
    static constexpr std::size_t size = 8;
    static constexpr std::size_t step = 4;

    KT_AVX2 static inline Vector zero() { return _mm256_setzero_pd(); }
    KT_AVX2 static inline Vector load(const Byte* from)
    {
        return _mm256_castsi256_pd(Big ? swap8(load32(from)) : load32(from));
    }
    KT_AVX2 static inline Vector lower(Vector a, Vector b) { return _mm256_min_pd(a, b); }
    KT_AVX2 static inline Vector higher(Vector a, Vector b) { return _mm256_max_pd(a, b); }
    template <Vector (*Choose)(Vector, Vector)>
    KT_AVX2 static inline __m128 evenAndOdd(Vector value)
    {
        return _mm256_cvtpd_ps(Choose(value, _mm256_permute2f128_pd(value, value, 1)));
    }
};

// What is left behind the last whole vector.
void addRest(const Byte* from, SampleFormat format, std::size_t count, SampleExtremes& extremes)
{
    SampleExtremes rest;
    sampleExtremesPlain(from, format, count, 1, &rest);
    for (const int side : {0, 1}) {
        extremes.lowest[side] = std::min(extremes.lowest[side], rest.lowest[side]);
        extremes.highest[side] = std::max(extremes.highest[side], rest.highest[side]);
    }
}

template <class Format>
struct Lanes {
    typename Format::Vector lowest;
    typename Format::Vector highest;

    KT_AVX2 Lanes() : lowest(Format::zero()), highest(Format::zero()) {}
    KT_AVX2 inline void add(const Byte* from)
    {
        const auto samples = Format::load(from);
        lowest = Format::lower(samples, lowest);
        highest = Format::higher(samples, highest);
    }
};

template <class Format>
KT_AVX2 void extremesOf(const Byte* from, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to)
{
    constexpr std::size_t vector = Format::step * Format::size; // in bytes
    const std::size_t vectors = samplesPerRun / Format::step;
    const std::size_t rest = samplesPerRun % Format::step;
    for (std::size_t run = 0; run < runs; ++run) {
        Lanes<Format> first, second; // so that one comparison need not wait for the one before
        for (std::size_t fours = vectors / 4; fours > 0; --fours, from += 4 * vector) {
            first.add(from);
            second.add(from + vector);
            first.add(from + 2 * vector);
            second.add(from + 3 * vector);
        }
        for (std::size_t left = vectors % 4; left > 0; --left, from += vector)
            first.add(from);
        const auto lowest = Format::lower(first.lowest, second.lowest);
        const auto highest = Format::higher(first.highest, second.highest);
        _mm_storeu_ps(to[run].lowest, _mm_movelh_ps(Format::template evenAndOdd<Format::lower>(lowest),
                                                    Format::template evenAndOdd<Format::higher>(highest)));
        if (rest > 0) {
            addRest(from, format, rest, to[run]);
            from += rest * Format::size;
        }
    }
}
static_assert(sizeof(SampleExtremes) == 4 * sizeof(float)); // the four are stored at once

using Road = void (*)(const Byte*, SampleFormat, std::size_t, std::size_t, SampleExtremes*);

template <bool Big>
Road roadOf(SampleFormat format)
{
    if (format.isFloat)
        return format.bits == 64 ? extremesOf<Doubles<Big>> : extremesOf<Floats<Big>>;
    switch (format.bits) {
    case 8:
        return format.isUnsigned ? extremesOf<Integers<1, Big, true>> : extremesOf<Integers<1, Big>>;
    case 16:
        return extremesOf<Integers<2, Big>>;
    case 24:
        return extremesOf<Integers<3, Big>>;
    default:
        return extremesOf<Integers<4, Big>>;
    }
}

} // namespace

void sampleExtremesAVX2(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to)
{
    const Road road = format.order == std::endian::big ? roadOf<true>(format) : roadOf<false>(format);
    road(static_cast<const Byte*>(samples), format, samplesPerRun, runs, to);
}

} // namespace platform

#else

namespace platform {

void sampleExtremesAVX2(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to)
{
    sampleExtremesPlain(samples, format, samplesPerRun, runs, to);
}

} // namespace platform

#endif
