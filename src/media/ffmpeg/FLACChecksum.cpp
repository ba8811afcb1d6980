#include "media/ffmpeg/FLACChecksum.h"

#include "media/packets/HighFirstCRC.h"

#include <array>
#include <cstddef>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

namespace platform::ffmpeg {

namespace {

constexpr std::uint32_t kPolynomial = 0x8005; // and x to the power of 16

#if defined(__x86_64__)

/// x to the power of `exponent`, modulo the polynomial.
constexpr long long power(int exponent)
{
    std::uint32_t value = 1;
    for (int i = 0; i < exponent; ++i)
        value = (value << 1 & 0xFFFF) ^ ((value & 0x8000) != 0 ? kPolynomial : 0);
    return value;
}

/// The block, 16 bytes of which the first counts most, moved ahead by so many bits, modulo the polynomial.
template <int bits>
__attribute__((target("pclmul,ssse3"))) __m128i moved(__m128i block)
{
    const __m128i powers = _mm_set_epi64x(power(bits + 64), power(bits));
    return _mm_xor_si128(_mm_clmulepi64_si128(block, powers, 0x11), _mm_clmulepi64_si128(block, powers, 0x00));
}

__attribute__((target("pclmul,ssse3"))) __m128i blockAt(const std::byte* bytes)
{
    const __m128i reversed = _mm_set_epi8(0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15);
    return _mm_shuffle_epi8(_mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)), reversed);
}

/// Folds blocks, four side by side, into one that leaves the same remainder. There must be four.
__attribute__((target("pclmul,ssse3"))) std::uint32_t foldedCRC16(BytesView bytes)
{
    constexpr std::size_t size = 16;
    const std::byte* at = bytes.data();
    const std::byte* const end = at + bytes.size();
    __m128i a = blockAt(at), b = blockAt(at + size), c = blockAt(at + 2 * size), d = blockAt(at + 3 * size);
    for (at += 4 * size; static_cast<std::size_t>(end - at) >= 4 * size; at += 4 * size) {
        a = _mm_xor_si128(moved<512>(a), blockAt(at));
        b = _mm_xor_si128(moved<512>(b), blockAt(at + size));
        c = _mm_xor_si128(moved<512>(c), blockAt(at + 2 * size));
        d = _mm_xor_si128(moved<512>(d), blockAt(at + 3 * size));
    }
    b = _mm_xor_si128(moved<128>(a), b);
    c = _mm_xor_si128(moved<128>(b), c);
    d = _mm_xor_si128(moved<128>(c), d);
    std::array<std::byte, size> folded{};
    for (std::size_t i = 0; i < size; ++i)
        folded[i] = reinterpret_cast<const std::byte*>(&d)[size - 1 - i];
    return highFirstCRC<16, kPolynomial>({at, end}, highFirstCRC<16, kPolynomial>(folded));
}

#endif

} // namespace

std::uint32_t flacCRC16(BytesView bytes)
{
#if defined(__x86_64__)
    static const bool isFast = __builtin_cpu_supports("pclmul") && __builtin_cpu_supports("ssse3");
    if (isFast && bytes.size() >= 64)
        return foldedCRC16(bytes);
#endif
    return highFirstCRC<16, kPolynomial>(bytes);
}

} // namespace platform::ffmpeg
