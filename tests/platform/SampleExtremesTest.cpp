#include "platform/SampleExtremes.h"

#include "platform/core/Bytes.h"

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <limits>
#include <random>
#include <vector>

namespace {

using platform::SampleExtremes;
using platform::SampleFormat;
using std::endian;

std::array<float, 4> values(const SampleExtremes& extremes)
{
    return {extremes.lowest[0], extremes.lowest[1], extremes.highest[0], extremes.highest[1]};
}

// Random bytes are every integer there is; of floats they are huge numbers, infinities and NaNs as well.
TEST(SampleExtremes, FastRoadEqualsPlainRoadOnRandomBytes)
{
    std::mt19937 random(20);
    for (const endian order : {endian::little, endian::big})
        for (const SampleFormat format : {SampleFormat{8, false, true, order}, SampleFormat{8, false, false, order},
                                          SampleFormat{16, false, false, order}, SampleFormat{24, false, false, order},
                                          SampleFormat{32, false, false, order}, SampleFormat{32, true, false, order},
                                          SampleFormat{64, true, false, order}})
            for (std::size_t samplesPerRun = 0; samplesPerRun < 150; ++samplesPerRun) {
                const std::size_t runs = 1 + random() % 4;
                const std::size_t offset = random() % 9; // no alignment
                const std::size_t size = samplesPerRun * runs * static_cast<std::size_t>(format.bytesPerSample());
                std::vector<unsigned char> bytes(offset + size);
                for (unsigned char& byte : bytes)
                    byte = static_cast<unsigned char>(random());
                bytes.shrink_to_fit(); // a sanitizer sees a read beyond
                std::vector<SampleExtremes> fast(runs);
                std::vector<SampleExtremes> plain(runs);
                platform::sampleExtremes(bytes.data() + offset, format, samplesPerRun, runs, fast.data());
                platform::sampleExtremesPlain(bytes.data() + offset, format, samplesPerRun, runs, plain.data());
                for (std::size_t run = 0; run < runs; ++run)
                    ASSERT_EQ(values(fast[run]), values(plain[run]))
                        << format.bits << (format.isFloat ? " float " : " int ") << (order == endian::big) << ' '
                        << samplesPerRun;
            }
}

// Each value at each place of a run: in a vector, in the second of a pair, in the rest.
template <class Float>
void expectSpecialsToCount()
{
    constexpr Float infinity = std::numeric_limits<Float>::infinity();
    constexpr Float nan = std::numeric_limits<Float>::quiet_NaN();
    const SampleFormat format{8 * static_cast<int>(sizeof(Float)), true, false, endian::native};
    for (std::size_t place = 0; place < 41; ++place)
        for (const Float special : {nan, -nan, infinity, -infinity, Float(2), Float(-2)}) {
            std::vector<Float> samples(41, Float(0.25));
            samples[(place + 2) % samples.size()] = nan; // does not hide what came before it
            samples[place] = special;
            SampleExtremes extremes;
            platform::sampleExtremes(samples.data(), format, samples.size(), 1, &extremes);
            const std::size_t side = place % 2;
            const auto number = static_cast<float>(std::isnan(special) ? Float(0) : special);
            EXPECT_EQ(extremes.lowest[side], std::min(number, 0.0F)) << place << ' ' << special;
            EXPECT_EQ(extremes.highest[side], std::max(number, 0.25F)) << place << ' ' << special;
            EXPECT_EQ(extremes.lowest[1 - side], 0.0F);
            EXPECT_EQ(extremes.highest[1 - side], 0.25F);
        }
}

TEST(SampleExtremes, NaNCountsAsNothingAndInfinityAsItself)
{
    expectSpecialsToCount<float>();
    expectSpecialsToCount<double>();
}

} // namespace
