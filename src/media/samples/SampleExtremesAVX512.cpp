// Finds extremes like SampleExtremesAVX2.cpp, in vectors of twice the width.
#include "media/samples/SampleExtremesAVX2.h"

#if defined(KT_AVX2)

// From here on, functions are marked for AVX-512; the headers above keep AVX2.
#undef KT_VECTORS
#define KT_VECTORS __attribute__((target("avx512f,avx512bw,avx512vbmi")))

#include "media/samples/SampleKinds.h"
#include "media/samples/SampleRoads.h"
#include "media/samples/SampleVectorRoads.h"

#include <array>
#include <cstring>

namespace platform {
namespace avx512 { // not unnamed: the linker would merge equal roads of different files

using avx2::Byte;

// For each lane of `size` bytes, the source position of its bytes; a record of `Bytes` bytes fills the upper ones.
template <int Bytes, bool Big, std::size_t size = Bytes == 3 ? 4 : Bytes>
constexpr auto placesInLanes()
{
    std::array<Byte, 64> places{};
    for (std::size_t i = 0; i < places.size(); ++i) {
        const std::size_t byte = i % size - (size - Bytes);
        places[i] = static_cast<Byte>(i / size * Bytes + (Big ? Bytes - 1 - byte : byte));
    }
    return places;
}

template <int Bytes, bool Big>
KT_VECTORS inline __m512i load64(const Byte* from)
{
    alignas(64) static constexpr auto places = placesInLanes<Bytes, Big>();
    if constexpr (Bytes == 3)
        return _mm512_maskz_permutexvar_epi8(0xEEEE'EEEE'EEEE'EEEE, _mm512_load_si512(places.data()),
                                             _mm512_maskz_loadu_epi8(0xFFFF'FFFF'FFFF, from)); // none beyond 48
    else if constexpr (Big)
        return _mm512_permutexvar_epi8(_mm512_load_si512(places.data()), _mm512_loadu_si512(from));
    else
        return _mm512_loadu_si512(from);
}

// What the kinds share with AVX2: extremes are reduced to one AVX2 vector, which reduces them further.
template <class Half>
struct Twice : Half {
    using HalfVector = typename Half::Vector;
    static constexpr std::size_t step = 2 * Half::step;

    template <HalfVector (*Choose)(HalfVector, HalfVector), class Vector>
    KT_VECTORS static inline __m128 evenAndOdd(Vector value)
    {
        HalfVector halves[2];
        std::memcpy(halves, &value, sizeof value);
        return Half::template evenAndOdd<Choose>(Choose(halves[0], halves[1]));
    }
};

template <int Bytes, bool Big, bool Unsigned>
struct Integers : Twice<avx2::Integers<Bytes, Big, Unsigned>> {
    using Twice<avx2::Integers<Bytes, Big, Unsigned>>::higher;
    using Twice<avx2::Integers<Bytes, Big, Unsigned>>::lower;
    using Vector = __m512i;

    KT_VECTORS static inline Vector zero() { return _mm512_setzero_si512(); }
    KT_VECTORS static inline Vector load(const Byte* from)
    {
        constexpr bool turns = Big && Bytes > 1;
        const Vector samples = load64<Bytes, turns>(from);
        return Unsigned ? _mm512_xor_si512(samples, _mm512_set1_epi8(-128)) : samples;
    }
    KT_VECTORS static inline Vector lower(Vector a, Vector b)
    {
        return Bytes == 1 ? _mm512_min_epi8(a, b) : Bytes == 2 ? _mm512_min_epi16(a, b) : _mm512_min_epi32(a, b);
    }
    KT_VECTORS static inline Vector higher(Vector a, Vector b)
    {
        return Bytes == 1 ? _mm512_max_epi8(a, b) : Bytes == 2 ? _mm512_max_epi16(a, b) : _mm512_max_epi32(a, b);
    }
};

template <bool Big>
struct Floats : Twice<avx2::Floats<Big>> {
    using Twice<avx2::Floats<Big>>::higher;
    using Twice<avx2::Floats<Big>>::lower;
    using Vector = __m512;

    KT_VECTORS static inline Vector zero() { return _mm512_setzero_ps(); }
    KT_VECTORS static inline Vector load(const Byte* from) { return _mm512_castsi512_ps(load64<4, Big>(from)); }
    KT_VECTORS static inline Vector lower(Vector a, Vector b) { return _mm512_min_ps(a, b); }
    KT_VECTORS static inline Vector higher(Vector a, Vector b) { return _mm512_max_ps(a, b); }
};

template <bool Big>
struct Doubles : Twice<avx2::Doubles<Big>> {
    using Twice<avx2::Doubles<Big>>::higher;
    using Twice<avx2::Doubles<Big>>::lower;
    using Vector = __m512d;

    KT_VECTORS static inline Vector zero() { return _mm512_setzero_pd(); }
    KT_VECTORS static inline Vector load(const Byte* from) { return _mm512_castsi512_pd(load64<8, Big>(from)); }
    KT_VECTORS static inline Vector lower(Vector a, Vector b) { return _mm512_min_pd(a, b); }
    KT_VECTORS static inline Vector higher(Vector a, Vector b) { return _mm512_max_pd(a, b); }
};

} // namespace avx512

bool hasWiderRoads()
{
    static const bool hasAVX512 = [] {
        __builtin_cpu_init();
        return __builtin_cpu_supports("avx512bw") && __builtin_cpu_supports("avx512vbmi");
    }();
    return hasAVX512;
}

void sampleExtremesWider(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                         SampleExtremes* to)
{
    using namespace avx512;
    roadOf<VectorExtremes, Integers, Floats, Doubles>(format)(samples, format, samplesPerRun, runs, to);
}

} // namespace platform

#endif
