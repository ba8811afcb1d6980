// Samples are compared as they are stored, as SampleExtremesAVX2.cpp explains.
#include "media/samples/SampleLanesNEON.h"

#if defined(KT_NEON)

#include "media/samples/SampleKinds.h"
#include "media/samples/SampleRoads.h"
#include "media/samples/SampleVectorRoads.h"

#include <type_traits>

namespace platform {
namespace {

using namespace neon;

struct Pairs {
    static inline void store(float* to, float32x2_t first, float32x2_t second)
    {
        vst1q_f32(to, vcombine_f32(first, second));
    }
};

// Integers of `Bits` bits per lane; 24-bit samples have 32-bit lanes.
template <int Bits>
struct IntegerLanes : Pairs {
    using Vector = std::conditional_t<Bits == 8, int8x16_t, std::conditional_t<Bits == 16, int16x8_t, int32x4_t>>;

    static inline Vector zero() { return Vector{}; }
    static inline Vector lower(Vector a, Vector b)
    {
        if constexpr (Bits == 8)
            return vminq_s8(a, b);
        else if constexpr (Bits == 16)
            return vminq_s16(a, b);
        else
            return vminq_s32(a, b);
    }
    static inline Vector higher(Vector a, Vector b)
    {
        if constexpr (Bits == 8)
            return vmaxq_s8(a, b);
        else if constexpr (Bits == 16)
            return vmaxq_s16(a, b);
        else
            return vmaxq_s32(a, b);
    }
    // Moves the upper lanes' bytes down.
    template <int Bytes>
    static inline Vector moved(Vector value)
    {
        const auto bytes = reinterpret_cast<uint8x16_t>(value);
        return reinterpret_cast<Vector>(vextq_u8(bytes, bytes, Bytes));
    }
    template <Vector (*Choose)(Vector, Vector)>
    static inline float32x2_t evenAndOdd(Vector value)
    {
        value = Choose(value, moved<8>(value));
        if constexpr (Bits < 32)
            value = Choose(value, moved<4>(value));
        if constexpr (Bits < 16)
            value = Choose(value, moved<2>(value));
        return vcvt_n_f32_s32(int32x2_t{value[0], value[1]}, Bits - 1);
    }
};

template <int Bytes, bool Big, bool Unsigned>
struct Integers : IntegerLanes<Bytes == 3 ? 32 : 8 * Bytes> {
    static constexpr std::size_t size = Bytes;
    static constexpr std::size_t step = Bytes == 3 ? 4 : 16 / Bytes;

    static inline auto load(const Byte* from)
    {
        if constexpr (Bytes == 1)
            return vreinterpretq_s8_u8(veorq_u8(vld1q_u8(from), vdupq_n_u8(Unsigned ? 0x80 : 0)));
        else if constexpr (Bytes == 2)
            return vreinterpretq_s16_u8(ordered<2, Big>(vld1q_u8(from)));
        else if constexpr (Bytes == 3)
            return load24<Big>(from);
        else
            return vreinterpretq_s32_u8(ordered<4, Big>(vld1q_u8(from)));
    }
};

// Given a NaN and a number, `lower` and `higher` return their second argument. The dedicated instructions vminnm and
// vmaxnm would return a NaN for a signalling one.
template <bool Big>
struct Floats : Pairs {
    using Vector = float32x4_t;
    static constexpr std::size_t size = 4;
    static constexpr std::size_t step = 4;

    static inline Vector zero() { return Vector{}; }
    static inline Vector load(const Byte* from) { return vreinterpretq_f32_u8(ordered<4, Big>(vld1q_u8(from))); }
    static inline Vector lower(Vector a, Vector b) { return vbslq_f32(vcltq_f32(a, b), a, b); }
    static inline Vector higher(Vector a, Vector b) { return vbslq_f32(vcgtq_f32(a, b), a, b); }
    template <Vector (*Choose)(Vector, Vector)>
    static inline float32x2_t evenAndOdd(Vector value)
    {
        return vget_low_f32(Choose(value, vextq_f32(value, value, 2)));
    }
};

template <bool Big>
struct Doubles : Pairs {
    using Vector = float64x2_t;
    static constexpr std::size_t size = 8;
    static constexpr std::size_t step = 2;

    static inline Vector zero() { return Vector{}; }
    static inline Vector load(const Byte* from) { return vreinterpretq_f64_u8(ordered<8, Big>(vld1q_u8(from))); }
    static inline Vector lower(Vector a, Vector b) { return vbslq_f64(vcltq_f64(a, b), a, b); }
    static inline Vector higher(Vector a, Vector b) { return vbslq_f64(vcgtq_f64(a, b), a, b); }
    template <Vector (*Choose)(Vector, Vector)>
    static inline float32x2_t evenAndOdd(Vector value)
    {
        return vcvt_f32_f64(value);
    }
};

} // namespace

void sampleExtremesFast(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                        SampleExtremes* to)
{
    roadOf<VectorExtremes, Integers, Floats, Doubles>(format)(samples, format, samplesPerRun, runs, to);
}

} // namespace platform

#endif
