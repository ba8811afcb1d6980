// Waveform overviews: of whole files, compared with reading their bytes; and of streamed floats, compared with
// converting each before it is folded. Processor time throughout; files are in the page cache.
#include "Timing.h"
#include "audiofile/CAudioFileIO.h"
#include "loops/overview/MDOverview.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <malloc.h>
#include <sndfile.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <memory>
#include <random>
#include <string>
#include <vector>

namespace {

struct Kind {
    const char* name;
    int format; // libsndfile's format for writing the file
    int channels;
};
constexpr std::array<Kind, 5> kKinds{{{"wav24x2", SF_FORMAT_WAV | SF_FORMAT_PCM_24, 2},
                                      {"aiff16x2", SF_FORMAT_AIFF | SF_FORMAT_PCM_16, 2},
                                      {"caf32fx2", SF_FORMAT_CAF | SF_FORMAT_FLOAT, 2}, // big-endian
                                      {"wav24x24", SF_FORMAT_RF64 | SF_FORMAT_PCM_24, 24},
                                      {"caf32fx2le", SF_FORMAT_CAF | SF_FORMAT_FLOAT | SF_ENDIAN_LITTLE, 2}}};

/// The given number of minutes of noise, removed at the end.
class NoiseFile {
public:
    NoiseFile(const Kind& kind, int minutes)
        : path_(std::filesystem::temp_directory_path() / ("ktfiles-bench-" + std::to_string(getpid()) + kind.name))
    {
        constexpr int rate = 44100;
        constexpr sf_count_t block = 1 << 16;
        const sf_count_t frames = sf_count_t{rate} * 60 * minutes;
        SF_INFO info{0, rate, kind.channels, kind.format, 0, 0};
        SNDFILE* file = sf_open(path_.c_str(), SFM_WRITE, &info);
        if (file == nullptr)
            std::abort();
        std::mt19937 random(1);
        std::uniform_real_distribution<float> amplitude(-0.9F, 0.9F);
        std::vector<float> noise(static_cast<std::size_t>(block * kind.channels));
        for (float& sample : noise)
            sample = amplitude(random);
        sf_count_t written = 0;
        while (written < frames)
            if (const sf_count_t count = std::min(block, frames - written);
                sf_writef_float(file, noise.data(), count) == count)
                written += count;
            else
                std::abort();
        sf_close(file);
    }
    ~NoiseFile() { std::filesystem::remove(path_); }
    NoiseFile(const NoiseFile&) = delete;
    NoiseFile& operator=(const NoiseFile&) = delete;

    CFileRef ref() const { return CFileRef(path_.c_str(), false); }
    const char* path() const { return path_.c_str(); }

private:
    std::filesystem::path path_;
};

void readBytes(const char* path)
{
    constexpr std::size_t piece = 128 * 1024;
    const std::unique_ptr<char[]> buffer(new char[piece]);
    const int descriptor = open(path, O_RDONLY | O_CLOEXEC);
    off_t position = 0;
    while (const ssize_t got = pread(descriptor, buffer.get(), piece, position)) {
        if (got < 0)
            std::abort();
        position += got;
    }
    close(descriptor);
}

void readWithSndfile(const char* path)
{
    constexpr sf_count_t block = 32768;
    SF_INFO info{};
    SNDFILE* file = sf_open(path, SFM_READ, &info);
    if (file == nullptr)
        std::abort();
    std::vector<float> samples(static_cast<std::size_t>(block * info.channels));
    while (sf_readf_float(file, samples.data(), block) > 0)
        benchmark::ClobberMemory();
    sf_close(file);
}

void createOverview(const CFileRef& ref)
{
    CAudioFileIO file(ref, 0);
    const auto overview = file.CreateOverview();
    if (!overview)
        std::abort();
    benchmark::DoNotOptimize(overview->data());
}

/// Rate compared with a bare pread loop (at least 0.8) and with libsndfile (at least 2, for floats 1.3).
void CreateOverview(benchmark::State& state)
{
    const Kind& kind = kKinds[static_cast<std::size_t>(state.range(0))];
    const NoiseFile file(kind, static_cast<int>(state.range(1)));
    readBytes(file.path()); // loads the page cache
    double bare = 0, sndfile = 0, ours = 0;
    for (auto _ : state) {
        bare += processorSeconds([&] { readBytes(file.path()); });
        const double taken = processorSeconds([&] { createOverview(file.ref()); });
        sndfile += processorSeconds([&] { readWithSndfile(file.path()); });
        ours += taken;
        state.SetIterationTime(taken);
    }
    state.SetLabel(kind.name);
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(std::filesystem::file_size(file.path())));
    state.counters["of_bare"] = bare / ours;
    state.counters["of_sndfile"] = sndfile / ours;
}
BENCHMARK(CreateOverview)
    ->ArgNames({"kind", "minutes"})
    ->ArgsProduct({{0, 1, 2, 3, 4}, {10, 60}})
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->MinTime(0.3);

/// Peak memory, in MiB, of a process that makes the overview above that of one that does not; at most 8.
void CreateOverviewMemory(benchmark::State& state)
{
    const NoiseFile file(kKinds[0], static_cast<int>(state.range(0)));
    malloc_trim(0); // otherwise the child would reuse free memory of this process
    const auto peak = [&](bool works) {
        const pid_t child = fork();
        if (child == 0) {
            if (works)
                createOverview(file.ref());
            std::_Exit(0);
        }
        int status = 0;
        rusage usage{};
        wait4(child, &status, 0, &usage);
        return static_cast<double>(usage.ru_maxrss) / 1024;
    };
    for (auto _ : state) {
        const double empty = peak(false);
        state.counters["above_empty_MiB"] = peak(true) - empty;
    }
}
BENCHMARK(CreateOverviewMemory)->ArgName("minutes")->Arg(10)->Arg(60)->Iterations(1);

/// The reference: converts each float to a byte, then folds the bytes.
void addPlainly(MDOverview& overview, const float* samples, long start, long frames, int channels)
{
    constexpr platform::SampleFormat bytes{8, false, false, std::endian::native};
    std::array<std::int8_t, MDOverview::kMostChannels> converted;
    const long slice = MDOverview::kMostChannels / channels;
    for (long done = 0; done < frames; done += slice) {
        const long count = std::min(slice, frames - done);
        platform::floatToSamplesPlain(samples + done * channels, bytes, converted.data(),
                                      static_cast<std::size_t>(count * channels));
        overview.Add(converted.data(), start + done, count, channels, 1, 0);
    }
}

/// Blocks of 512 frames; at least 8 times the reference.
void AddFloats(benchmark::State& state)
{
    constexpr long block = 512, frames = 256 * block;
    const int channels = static_cast<int>(state.range(0));
    std::mt19937 random(1);
    std::uniform_real_distribution<float> amplitude(-1, 1);
    std::vector<float> samples(static_cast<std::size_t>(frames * channels));
    for (float& sample : samples)
        sample = amplitude(random);
    const auto add = [&](auto addBlock) {
        KTMem overview(OverviewBlockSize(frames));
        MDOverview accumulator(&overview);
        for (long frame = 0; frame < frames; frame += block)
            addBlock(accumulator, samples.data() + frame * channels, frame);
        benchmark::DoNotOptimize(accumulator.Finalize());
    };
    double plain = 0, ours = 0;
    for (auto _ : state) {
        plain += processorSeconds([&] {
            add([&](MDOverview& to, const float* from, long at) { addPlainly(to, from, at, block, channels); });
        });
        const double taken = processorSeconds(
            [&] { add([&](MDOverview& to, const float* from, long at) { to.Add(from, at, block, channels); }); });
        ours += taken;
        state.SetIterationTime(taken);
    }
    state.SetItemsProcessed(static_cast<std::int64_t>(state.iterations()) * frames * channels);
    state.counters["times_plain"] = plain / ours;
}
BENCHMARK(AddFloats)
    ->ArgName("channels")
    ->Arg(1)
    ->Arg(2)
    ->Arg(6)
    ->Arg(24)
    ->UseManualTime()
    ->Unit(benchmark::kMicrosecond);

} // namespace
