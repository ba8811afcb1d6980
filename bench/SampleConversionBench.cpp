// Converting samples to floats and back, and finding their extremes: 256 KiB of samples in the cache.
#include "media/samples/SampleConversion.h"
#include "media/samples/SampleExtremes.h"

#include <benchmark/benchmark.h>

#include <vector>

namespace {

constexpr std::size_t kBytes = 256 * 1024;

platform::SampleFormat formatOf(const benchmark::State& state)
{
    const auto bits = static_cast<int>(state.range(0));
    return {bits < 0 ? -bits : bits, bits < 0, false, state.range(1) != 0 ? std::endian::big : std::endian::little};
}

template <void (*Convert)(const void*, platform::SampleFormat, float*, std::size_t)>
void readSamples(benchmark::State& state)
{
    const platform::SampleFormat format = formatOf(state);
    const std::vector<unsigned char> samples(kBytes, 0x35);
    const std::size_t count = kBytes / static_cast<std::size_t>(format.bytesPerSample());
    std::vector<float> floats(count);
    for (auto _ : state) {
        Convert(samples.data(), format, floats.data(), count);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * std::int64_t{kBytes});
}

template <void (*Convert)(const float*, platform::SampleFormat, void*, std::size_t)>
void writeSamples(benchmark::State& state)
{
    const platform::SampleFormat format = formatOf(state);
    const std::size_t count = kBytes / static_cast<std::size_t>(format.bytesPerSample());
    const std::vector<float> floats(count, 0.3F);
    std::vector<unsigned char> samples(kBytes);
    for (auto _ : state) {
        Convert(floats.data(), format, samples.data(), count);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * std::int64_t{kBytes});
}

// Runs as in overviews: 256 frames of stereo.
void findExtremes(benchmark::State& state)
{
    constexpr std::size_t run = 512;
    const platform::SampleFormat format = formatOf(state);
    const std::vector<unsigned char> samples(kBytes, 0x35);
    const std::size_t runs = kBytes / static_cast<std::size_t>(format.bytesPerSample()) / run;
    std::vector<platform::SampleExtremes> extremes(runs);
    for (auto _ : state) {
        platform::sampleExtremes(samples.data(), format, run, runs, extremes.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * std::int64_t{kBytes});
}

// Bits per sample (negative: floats) and byte order.
void formats(benchmark::internal::Benchmark* bench)
{
    bench->ArgNames({"bits", "big"})->ArgsProduct({{8, 16, 24, 32, -32, -64}, {0, 1}});
}

BENCHMARK(readSamples<platform::samplesToFloat>)->Name("samplesToFloat")->Apply(formats);
BENCHMARK(readSamples<platform::samplesToFloatPlain>)->Name("samplesToFloatPlain")->Apply(formats);
BENCHMARK(writeSamples<platform::floatToSamples>)->Name("floatToSamples")->Apply(formats);
BENCHMARK(findExtremes)->Name("sampleExtremes")->Apply(formats);

} // namespace
