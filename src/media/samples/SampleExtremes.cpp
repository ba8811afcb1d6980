#include "media/samples/SampleExtremes.h"

#include "media/samples/SampleRoads.h"

#include <algorithm>
#include <array>

namespace platform {
namespace {

// A NaN fails both comparisons and so is ignored.
void fold(const float* samples, std::size_t count, SampleExtremes& extremes)
{
    for (std::size_t i = 0; i < count; ++i) {
        float& lowest = extremes.lowest[i % 2];
        float& highest = extremes.highest[i % 2];
        lowest = samples[i] < lowest ? samples[i] : lowest;
        highest = samples[i] > highest ? samples[i] : highest;
    }
}

} // namespace

void sampleExtremesPlain(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                         SampleExtremes* to)
{
    const auto* from = static_cast<const unsigned char*>(samples);
    std::array<float, 512> floats; // an even number, so that each piece starts with an even sample
    for (std::size_t run = 0; run < runs; ++run) {
        to[run] = {};
        for (std::size_t left = samplesPerRun; left > 0;) {
            const std::size_t count = std::min(left, floats.size());
            samplesToFloatPlain(from, format, floats.data(), count);
            fold(floats.data(), count, to[run]);
            from += count * static_cast<std::size_t>(format.bytesPerSample());
            left -= count;
        }
    }
}

void sampleExtremes(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                    SampleExtremes* to)
{
    if (hasWiderRoads())
        sampleExtremesWider(samples, format, samplesPerRun, runs, to);
    else if (hasFastRoads())
        sampleExtremesFast(samples, format, samplesPerRun, runs, to);
    else
        sampleExtremesPlain(samples, format, samplesPerRun, runs, to);
}

} // namespace platform
