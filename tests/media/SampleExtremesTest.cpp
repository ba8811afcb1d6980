#include "media/samples/SampleRoads.h"

#include "platform/core/Bytes.h"

#include <gtest/gtest.h>

#include <array>
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

// The fast roads that this processor supports.
std::vector<decltype(&platform::sampleExtremes)> fastRoads()
{
    std::vector<decltype(&platform::sampleExtremes)> roads{platform::sampleExtremes};
    if (platform::hasFastRoads())
        roads.push_back(platform::sampleExtremesFast);
    if (platform::hasWiderRoads())
        roads.push_back(platform::sampleExtremesWider);
    return roads;
}

// Random bytes cover all integers; as floats they include huge values, infinities and NaNs.
TEST(SampleExtremes, FastRoadsEqualPlainRoadOnRandomBytes)
{
    std::mt19937 random(20);
    for (const endian order : {endian::little, endian::big})
        for (const SampleFormat format : {SampleFormat{8, false, true, order}, SampleFormat{8, false, false, order},
                                          SampleFormat{16, false, false, order}, SampleFormat{24, false, false, order},
                                          SampleFormat{32, false, false, order}, SampleFormat{32, true, false, order},
                                          SampleFormat{64, true, false, order}})
            for (std::size_t samplesPerRun = 0; samplesPerRun < 300; ++samplesPerRun) {
                const std::size_t runs = 1 + random() % 4;
                const std::size_t offset = random() % 9; // no alignment
                const std::size_t size = samplesPerRun * runs * static_cast<std::size_t>(format.bytesPerSample());
                std::vector<unsigned char> bytes(offset + size);
                for (unsigned char& byte : bytes)
                    byte = static_cast<unsigned char>(random());
                bytes.shrink_to_fit(); // a sanitizer sees a read beyond
                std::vector<SampleExtremes> fast(runs);
                std::vector<SampleExtremes> plain(runs);
                platform::sampleExtremesPlain(bytes.data() + offset, format, samplesPerRun, runs, plain.data());
                for (const auto road : fastRoads()) {
                    road(bytes.data() + offset, format, samplesPerRun, runs, fast.data());
                    for (std::size_t run = 0; run < runs; ++run)
                        ASSERT_EQ(values(fast[run]), values(plain[run]))
                            << format.bits << (format.isFloat ? " float " : " int ") << (order == endian::big) << ' '
                            << samplesPerRun;
                }
            }
}

} // namespace
