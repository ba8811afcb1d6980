// Loads samples into vector lanes, for the fast roads with NEON. For their .cpp files only.
#pragma once

#include "media/samples/SampleVectors.h"

#if defined(KT_NEON)

#include <arm_neon.h>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace platform::neon {

using Byte = unsigned char;

/// Reverses the bytes of each sample of `Bytes` bytes if the file's samples are big-endian.
template <int Bytes, bool Big>
inline uint8x16_t ordered(uint8x16_t bytes)
{
    if constexpr (!Big || Bytes == 1)
        return bytes;
    else if constexpr (Bytes == 2)
        return vrev16q_u8(bytes);
    else if constexpr (Bytes == 4)
        return vrev32q_u8(bytes);
    else
        return vrev64q_u8(bytes);
}

/// Four samples of 3 bytes, each in the upper bytes of a lane of 4.
template <bool Big>
inline int32x4_t load24(const Byte* from)
{
    constexpr Byte none = 255; // an index that yields 0
    constexpr Byte little[] = {none, 0, 1, 2, none, 3, 4, 5, none, 6, 7, 8, none, 9, 10, 11};
    constexpr Byte big[] = {none, 2, 1, 0, none, 5, 4, 3, none, 8, 7, 6, none, 11, 10, 9};
    std::uint32_t last; // loads the 12 bytes and none beyond
    std::memcpy(&last, from + 8, sizeof last);
    const uint8x16_t bytes = vcombine_u8(vld1_u8(from), vcreate_u8(last));
    return vreinterpretq_s32_u8(vqtbl1q_u8(bytes, vld1q_u8(Big ? big : little)));
}

} // namespace platform::neon

#endif
