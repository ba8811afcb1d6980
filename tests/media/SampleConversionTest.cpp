#include "media/samples/SampleConversion.h"

#include "platform/core/Bytes.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <random>
#include <vector>

namespace {

using platform::SampleFormat;
using std::endian;

std::vector<SampleFormat> allFormats()
{
    std::vector<SampleFormat> formats;
    for (const endian order : {endian::little, endian::big}) {
        formats.push_back({8, false, true, order});
        for (const int bits : {8, 16, 24, 32})
            formats.push_back({bits, false, false, order});
        for (const int bits : {32, 64})
            formats.push_back({bits, true, false, order});
    }
    return formats;
}

std::string nameOf(SampleFormat format)
{
    const std::string kind = format.isFloat ? " float" : format.isUnsigned ? " unsigned" : " int";
    return std::to_string(format.bits) + kind + (format.order == endian::big ? " big" : " little");
}

std::size_t bytesOf(SampleFormat format, std::size_t count)
{
    return count * static_cast<std::size_t>(format.bytesPerSample());
}

TEST(SampleConversion, ClampsRoundsHalfToEvenAndSilencesNaN)
{
    constexpr float infinity = std::numeric_limits<float>::infinity();
    // Eight samples take the fast road and the rest the plain one; then the other way round.
    std::vector<float> from{1.0F, -1.0F, 7.5F,  -infinity, infinity, NAN,      0.5F,
                            1.5F, 2.5F,  -2.5F, 32766.5F,  32767.5F, -32767.5F};
    std::transform(from.begin() + 6, from.end(), from.begin() + 6, [](float sample) { return sample / 32768; });
    from.push_back(1e-40F);
    std::vector<std::int16_t> expected{32767, -32768, 32767, -32768, 32767, 0, 0, 2, 2, -2, 32766, 32767, -32768, 0};
    for (int round = 0; round < 2; ++round) {
        std::vector<std::int16_t> to(from.size());
        platform::floatToSamples(from.data(), {16, false, false, endian::native}, to.data(), from.size());
        EXPECT_EQ(to, expected);
        std::reverse(from.begin(), from.end());
        std::reverse(expected.begin(), expected.end());
    }
    const std::vector<float> loud(9, 1.0F);
    std::vector<std::int32_t> to(9);
    platform::floatToSamples(loud.data(), {32, false, false, endian::native}, to.data(), 9);
    EXPECT_EQ(to, std::vector<std::int32_t>(9, INT32_MAX));
}

// Random samples at the end of their memory, where a sanitizer detects reads beyond them, including every kind of float
// that is not a number.
Bytes randomSamples(SampleFormat format, std::size_t offset, std::size_t count, std::mt19937& random)
{
    Bytes bytes(offset + bytesOf(format, count));
    for (std::byte& byte : bytes)
        byte = static_cast<std::byte>(random());
    return bytes;
}

std::vector<float> randomFloats(std::size_t count, std::mt19937& random)
{
    constexpr float infinity = std::numeric_limits<float>::infinity();
    constexpr float special[] = {NAN, infinity, -infinity, 1.0F, -1.0F, 0.99999994F, -0.0F, 1e-45F, 3e38F, -3e38F};
    std::uniform_real_distribution<float> within(-1.1F, 1.1F);
    std::vector<float> floats(count);
    for (float& sample : floats) {
        const auto choice = random() % 40;
        const float halfway = (static_cast<float>(random() % 65536) - 32767.5F) / 32768; // between two integers
        sample = choice < 10 ? special[choice] : choice < 18 ? halfway : within(random);
    }
    return floats;
}

TEST(SampleConversion, FastRoadsGiveWhatThePlainOnesGive)
{
    std::mt19937 random(1);
    for (const SampleFormat format : allFormats())
        for (std::size_t offset = 0; offset < 8; ++offset)
            for (std::size_t count = 0; count <= 70; ++count) {
                const Bytes samples = randomSamples(format, offset, count, random);
                std::vector<float> fast(count + 1, 123.0F);
                std::vector<float> plain(count + 1, 123.0F);
                platform::samplesToFloat(samples.data() + offset, format, fast.data(), count);
                platform::samplesToFloatPlain(samples.data() + offset, format, plain.data(), count);
                ASSERT_EQ(std::memcmp(fast.data(), plain.data(), (count + 1) * sizeof(float)), 0)
                    << nameOf(format) << " count " << count << " offset " << offset;

                const std::vector<float> floats = randomFloats(count, random);
                Bytes fastBytes(offset + bytesOf(format, count) + 1, std::byte{0xAA});
                Bytes plainBytes = fastBytes;
                platform::floatToSamples(floats.data(), format, fastBytes.data() + offset, count);
                platform::floatToSamplesPlain(floats.data(), format, plainBytes.data() + offset, count);
                ASSERT_EQ(fastBytes, plainBytes) << nameOf(format) << " count " << count << " offset " << offset;
                if (!format.isFloat && format.bits != 32) { // integers come back unchanged
                    Bytes back(samples.begin(), samples.begin() + static_cast<std::ptrdiff_t>(offset));
                    back.resize(samples.size());
                    platform::floatToSamples(fast.data(), format, back.data() + offset, count);
                    ASSERT_EQ(back, samples) << nameOf(format);
                }
            }
}

} // namespace
