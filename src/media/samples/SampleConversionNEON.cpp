#include "media/samples/SampleLanesNEON.h"

#if defined(KT_NEON)

#include "media/samples/SampleKinds.h"
#include "media/samples/SampleRoads.h"
#include "media/samples/SampleVectorRoads.h"

#include <utility>

namespace platform {
namespace {

using namespace neon;

// Eight samples, left-aligned or not; as fixed-point numbers they have no bits before the point but the sign.
template <int Bytes, bool Big, bool Unsigned>
struct Integers {
    static constexpr std::size_t size = Bytes;
    // 24-bit samples are in the upper bytes of their lanes, where conversion is exact.
    static constexpr int laneBits = Bytes == 3 ? 32 : 8 * Bytes;

    static inline int32x4x2_t lanes(const Byte* from)
    {
        if constexpr (Bytes == 1) {
            const uint8x8_t bytes = veor_u8(vld1_u8(from), vdup_n_u8(Unsigned ? 0x80 : 0));
            return widened(vmovl_s8(vreinterpret_s8_u8(bytes)));
        } else if constexpr (Bytes == 2) {
            return widened(vreinterpretq_s16_u8(ordered<2, Big>(vld1q_u8(from))));
        } else if constexpr (Bytes == 3) {
            return {{load24<Big>(from), load24<Big>(from + 12)}};
        } else {
            return {{vreinterpretq_s32_u8(ordered<4, Big>(vld1q_u8(from))),
                     vreinterpretq_s32_u8(ordered<4, Big>(vld1q_u8(from + 16)))}};
        }
    }

    static inline int32x4x2_t widened(int16x8_t words)
    {
        return {{vmovl_s16(vget_low_s16(words)), vmovl_high_s16(words)}};
    }

    static inline void read(const Byte* from, float* to)
    {
        const int32x4x2_t samples = lanes(from);
        vst1q_f32(to, vcvtq_n_f32_s32(samples.val[0], laneBits - 1));
        vst1q_f32(to + 4, vcvtq_n_f32_s32(samples.val[1], laneBits - 1));
    }

    // Four integers, rounded half to even and clamped to 32 bits; a NaN becomes 0.
    static inline int32x4_t rounded(const float* from)
    {
        constexpr float full = static_cast<float>(std::uint32_t{1} << (8 * Bytes - 1));
        return vcvtnq_s32_f32(vmulq_n_f32(vld1q_f32(from), full));
    }

    static inline void write(Byte* to, const float* from)
    {
        const int32x4_t first = rounded(from), second = rounded(from + 4);
        if constexpr (Bytes == 4) {
            vst1q_u8(to, ordered<4, Big>(vreinterpretq_u8_s32(first)));
            vst1q_u8(to + 16, ordered<4, Big>(vreinterpretq_u8_s32(second)));
        } else if constexpr (Bytes == 3) {
            const uint32x4_t low = clamped24(first), high = clamped24(second);
            const uint16x8_t lower = vcombine_u16(vmovn_u32(low), vmovn_u32(high));
            const uint16x8_t upper = vcombine_u16(vshrn_n_u32(low, 16), vshrn_n_u32(high, 16));
            uint8x8x3_t bytes{{vmovn_u16(lower), vshrn_n_u16(lower, 8), vmovn_u16(upper)}};
            if constexpr (Big)
                std::swap(bytes.val[0], bytes.val[2]);
            vst3_u8(to, bytes);
        } else {
            const int16x8_t words = vcombine_s16(vqmovn_s32(first), vqmovn_s32(second));
            if constexpr (Bytes == 2)
                vst1q_u8(to, ordered<2, Big>(vreinterpretq_u8_s16(words)));
            else
                vst1_u8(to, veor_u8(vreinterpret_u8_s8(vqmovn_s16(words)), vdup_n_u8(Unsigned ? 0x80 : 0)));
        }
    }

    static inline uint32x4_t clamped24(int32x4_t values)
    {
        constexpr std::int32_t full = 1 << 23;
        return vreinterpretq_u32_s32(vminq_s32(vmaxq_s32(values, vdupq_n_s32(-full)), vdupq_n_s32(full - 1)));
    }
};

template <bool Big>
struct Floats {
    static constexpr std::size_t size = 4;

    static inline void read(const Byte* from, float* to) { copy(from, reinterpret_cast<Byte*>(to)); }
    static inline void write(Byte* to, const float* from) { copy(reinterpret_cast<const Byte*>(from), to); }
    static inline void copy(const Byte* from, Byte* to)
    {
        vst1q_u8(to, ordered<4, Big>(vld1q_u8(from)));
        vst1q_u8(to + 16, ordered<4, Big>(vld1q_u8(from + 16)));
    }
};

template <bool Big>
struct Doubles {
    static constexpr std::size_t size = 8;

    static inline void read(const Byte* from, float* to)
    {
        for (std::size_t pair = 0; pair < 4; ++pair) {
            const uint8x16_t words = ordered<8, Big>(vld1q_u8(from + 16 * pair));
            vst1_f32(to + 2 * pair, vcvt_f32_f64(vreinterpretq_f64_u8(words)));
        }
    }

    static inline void write(Byte* to, const float* from)
    {
        for (std::size_t pair = 0; pair < 4; ++pair) {
            const float64x2_t words = vcvt_f64_f32(vld1_f32(from + 2 * pair));
            vst1q_u8(to + 16 * pair, ordered<8, Big>(vreinterpretq_u8_f64(words)));
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
