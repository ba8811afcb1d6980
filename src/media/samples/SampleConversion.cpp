#include "media/samples/SampleConversion.h"

#include "media/samples/SampleKinds.h"
#include "media/samples/SampleRoads.h"
#include "platform/core/Packed.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace platform {
namespace {

using Byte = unsigned char;

// An integer sample in `Bytes` bytes, right-aligned, in host order.
template <int Bytes, std::endian Order>
std::int32_t loadInteger(const Byte* from)
{
    if constexpr (Bytes == 1)
        return static_cast<std::int8_t>(*from);
    else if constexpr (Bytes == 2)
        return load<std::int16_t>(from, Order);
    else if constexpr (Bytes == 4)
        return load<std::int32_t>(from, Order);
    else {
        constexpr bool little = Order == std::endian::little;
        const auto high = static_cast<std::uint32_t>(from[little ? 2 : 0]) << 24;
        const auto low = static_cast<std::uint32_t>(from[1]) << 16 | static_cast<std::uint32_t>(from[little ? 0 : 2])
                                                                         << 8;
        return static_cast<std::int32_t>(high | low) >> 8;
    }
}

template <int Bytes, std::endian Order>
void storeInteger(Byte* to, std::int32_t value)
{
    if constexpr (Bytes == 1)
        *to = static_cast<Byte>(value);
    else if constexpr (Bytes == 2)
        store(to, static_cast<std::int16_t>(value), Order);
    else if constexpr (Bytes == 4)
        store(to, value, Order);
    else {
        constexpr bool little = Order == std::endian::little;
        to[little ? 2 : 0] = static_cast<Byte>(value >> 16);
        to[1] = static_cast<Byte>(value >> 8);
        to[little ? 0 : 2] = static_cast<Byte>(value);
    }
}

// 2^(bits-1), the factor of full scale.
template <int Bytes>
constexpr float kFullScale = static_cast<float>(std::uint32_t{1} << (8 * Bytes - 1));

// Rounds half to even in the rounding mode that every thread starts with, and clamps. A NaN becomes silence.
template <int Bytes>
std::int32_t rounded(float sample)
{
    const float scaled = sample * kFullScale<Bytes>;
    if (std::isnan(scaled))
        return 0;
    constexpr auto highest = static_cast<std::int32_t>((std::uint32_t{1} << (8 * Bytes - 1)) - 1);
    if (scaled >= kFullScale<Bytes>)
        return highest;
    if (scaled <= -kFullScale<Bytes>)
        return -highest - 1;
    return static_cast<std::int32_t>(std::min<long>(std::lrint(scaled), highest));
}

template <bool isBig>
constexpr std::endian kOrder = isBig ? std::endian::big : std::endian::little;

// Each kind converts one sample of `size` bytes to or from a float.
template <int Bytes, bool isBig, bool isUnsigned>
struct Integers {
    static constexpr std::size_t size = Bytes;
    static constexpr Byte flip = isUnsigned ? 0x80 : 0; // unsigned bytes only
    static float read(const Byte* from)
    {
        const Byte flipped = static_cast<Byte>(*from ^ flip);
        return static_cast<float>(loadInteger<Bytes, kOrder<isBig>>(isUnsigned ? &flipped : from)) / kFullScale<Bytes>;
    }
    static void write(Byte* to, float sample)
    {
        storeInteger<Bytes, kOrder<isBig>>(to, rounded<Bytes>(sample));
        *to = static_cast<Byte>(*to ^ flip);
    }
};

template <class Float, bool isBig>
struct FloatsOf {
    static constexpr std::size_t size = sizeof(Float);
    static float read(const Byte* from) { return static_cast<float>(load<Float>(from, kOrder<isBig>)); }
    static void write(Byte* to, float sample) { store(to, static_cast<Float>(sample), kOrder<isBig>); }
};

template <bool isBig>
using Floats = FloatsOf<float, isBig>;

template <bool isBig>
using Doubles = FloatsOf<double, isBig>;

template <class Kind>
struct Reader {
    static void run(const void* samples, float* to, std::size_t count)
    {
        const auto* from = static_cast<const Byte*>(samples);
        for (std::size_t i = 0; i < count; ++i)
            to[i] = Kind::read(from + i * Kind::size);
    }
};

template <class Kind>
struct Writer {
    static void run(const float* from, void* samples, std::size_t count)
    {
        auto* to = static_cast<Byte*>(samples);
        for (std::size_t i = 0; i < count; ++i)
            Kind::write(to + i * Kind::size, from[i]);
    }
};

template <class T>
void swapEach(Byte* at, std::size_t count)
{
    for (std::size_t i = 0; i < count; ++i)
        store(at + i * sizeof(T), load<T>(at + i * sizeof(T), std::endian::little), std::endian::big);
}

} // namespace

void samplesToFloatPlain(const void* samples, SampleFormat format, float* to, std::size_t count)
{
    roadOf<Reader, Integers, Floats, Doubles>(format)(samples, to, count);
}

void floatToSamplesPlain(const float* from, SampleFormat format, void* samples, std::size_t count)
{
    roadOf<Writer, Integers, Floats, Doubles>(format)(from, samples, count);
}

void swapSamples(void* samples, int bytesPerSample, std::size_t count)
{
    auto* at = static_cast<Byte*>(samples);
    switch (bytesPerSample) {
    case 2:
        return swapEach<std::uint16_t>(at, count);
    case 3:
        for (std::size_t i = 0; i < count; ++i)
            std::swap(at[3 * i], at[3 * i + 2]);
        return;
    case 4:
        return swapEach<std::uint32_t>(at, count);
    case 8:
        return swapEach<std::uint64_t>(at, count);
    default:
        return;
    }
}

void samplesToFloat(const void* samples, SampleFormat format, float* to, std::size_t count)
{
    const std::size_t done = hasFastRoads() ? samplesToFloatFast(samples, format, to, count) : 0;
    const std::size_t offset = done * static_cast<std::size_t>(format.bytesPerSample());
    samplesToFloatPlain(static_cast<const Byte*>(samples) + offset, format, to + done, count - done);
}

void floatToSamples(const float* from, SampleFormat format, void* samples, std::size_t count)
{
    const std::size_t done = hasFastRoads() ? floatToSamplesFast(from, format, samples, count) : 0;
    const std::size_t offset = done * static_cast<std::size_t>(format.bytesPerSample());
    floatToSamplesPlain(from + done, format, static_cast<Byte*>(samples) + offset, count - done);
}

} // namespace platform
