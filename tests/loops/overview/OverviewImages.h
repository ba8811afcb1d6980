// Shared by the tests of overviews: samples of every format, containers around them, and the plain road as a reference
// for the fast one.
#pragma once

#include "loops/overview/MDOverview.h"
#include "support/ContainerBuilder.h"
#include "support/Hex.h"

#include <algorithm>
#include <random>
#include <string>
#include <utility>
#include <vector>

using Points = std::vector<std::pair<int, int>>; // minimum, maximum

inline Points pointsOf(const KTMem& block)
{
    Points points;
    for (std::size_t i = 0; i < OverviewPoints(block); ++i)
        points.emplace_back(OverviewPointsOf(block)[i].minimum, OverviewPointsOf(block)[i].maximum);
    return points;
}

inline Bytes bytesOf(const KTMem& block)
{
    return Bytes(block.data(), block.data() + block.size());
}

/// A block of these bytes.
inline KTMem blockOf(BytesView bytes)
{
    KTMem block(bytes.size());
    std::copy(bytes.begin(), bytes.end(), block.data());
    return block;
}

/// A block of that many frames with these points.
inline KTMem blockOf(std::uint32_t frames, std::initializer_list<OverviewPoint> points)
{
    KTMem block(kOverviewHeaderSize + points.size() * sizeof(OverviewPoint));
    SetOverviewFrames(block, frames);
    std::copy(points.begin(), points.end(), OverviewPointsOf(block));
    return block;
}

inline std::vector<platform::SampleFormat> storedFormats()
{
    std::vector<platform::SampleFormat> formats{{8, false, true, std::endian::little}};
    for (const std::endian order : {std::endian::little, std::endian::big})
        for (const int bits : {8, 16, 24, 32, -32, -64})
            formats.push_back({std::abs(bits), bits < 0, false, order});
    return formats;
}

inline std::string nameOf(platform::SampleFormat format)
{
    return std::to_string(format.bits) +
           (format.isFloat      ? " float"
            : format.isUnsigned ? " unsigned"
                                : " int") +
           (format.order == std::endian::big ? " big" : " little");
}

/// Samples with every value of their format; floats include values beyond full scale and NaNs.
inline Bytes randomSamples(std::mt19937& random, platform::SampleFormat format, std::size_t count)
{
    Bytes samples(count * static_cast<std::size_t>(format.bytesPerSample()));
    if (!format.isFloat) {
        std::generate(samples.begin(), samples.end(), [&] { return static_cast<std::byte>(random()); });
        return samples;
    }
    std::uniform_real_distribution<float> amplitude(-1.1F, 1.1F);
    std::vector<float> floats(count);
    for (float& sample : floats)
        sample = random() % 97 == 0 ? std::bit_cast<float>(static_cast<std::uint32_t>(random()))
                                    : amplitude(random) * (random() % 2 != 0 ? 0.1F : 1.0F);
    platform::floatToSamples(floats.data(), format, samples.data(), count);
    return samples;
}

/// The body of a WAVE "fmt " chunk; floats have their own tag.
inline Bytes waveFormat(platform::SampleFormat format, int channels)
{
    return waveFormat(format.isFloat ? 3 : 1, channels, 44100, channels * format.bytesPerSample(), format.bits);
}

inline Bytes cafDescription(platform::SampleFormat format, int channels)
{
    const auto number = [](int value) { return static_cast<std::uint32_t>(value); };
    const int flags = (format.isFloat ? 1 : 0) | (format.order == std::endian::little ? 2 : 0);
    return cafDescription(
        44100, "lpcm",
        {number(flags), number(channels * format.bytesPerSample()), 1, number(channels), number(format.bits)});
}

/// A file of the samples: WAVE for 8 unsigned bits, else CAF.
inline Bytes imageOf(platform::SampleFormat format, int channels, BytesView samples)
{
    if (format.isUnsigned)
        return ContainerBuilder("RIFF").chunk("fmt ", waveFormat(format, channels)).chunk("data", samples).bytes();
    ByteWriter data;
    data.write(std::uint32_t{0x01020304}); // edit count
    data.write(samples);
    return ContainerBuilder("caff").chunk("desc", cafDescription(format, channels)).chunk("data", data.view()).bytes();
}

/// The plain road: converts each sample to a float, then to a signed byte, and adds the bytes in the prescribed slices.
inline void addPlainly(MDOverview& overview, const float* samples, long start, long frames, int channels)
{
    const platform::SampleFormat bytes{8, false, false, std::endian::native};
    const long slice = 2048 / channels;
    std::vector<std::int8_t> converted(2048);
    for (long done = 0; done < frames; done += slice) {
        const long count = std::min(slice, frames - done);
        platform::floatToSamplesPlain(samples + done * channels, bytes, converted.data(),
                                      static_cast<std::size_t>(count * channels));
        overview.Add(converted.data(), start + done, count, channels, 1, 0);
    }
}

inline Bytes plainOverview(platform::SampleFormat format, int channels, BytesView samples)
{
    const std::size_t count = samples.size() / static_cast<std::size_t>(format.bytesPerSample());
    const long frames = static_cast<long>(count) / channels;
    std::vector<float> floats(count);
    platform::samplesToFloatPlain(samples.data(), format, floats.data(), count);
    KTMem block(OverviewBlockSize(frames));
    MDOverview overview(&block);
    addPlainly(overview, floats.data(), 0, frames, channels);
    return bytesOf(*overview.Finalize());
}
