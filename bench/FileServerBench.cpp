// The registry of shared samples: a thousand files of one second, compared with libsndfile reading them as floats; and
// the cost of another client of a registered file.
#include "LoopFiles.h"
#include "Timing.h"
#include "audiofile/CAudioFileIO.h"
#include "files/registry/CFileServer.h"

#include <benchmark/benchmark.h>
#include <sndfile.h>

#include <algorithm>
#include <cmath>
#include <memory>

namespace {

constexpr int kFiles = 1000;
constexpr long kFrames = 44100;

/// Half of them mono, half stereo, 16-bit WAVE.
const std::vector<CFileRef>& sampleFiles()
{
    static const BenchFolder folder;
    static const std::vector<CFileRef> files = [] {
        std::vector<CFileRef> made;
        std::vector<float> samples(2 * kFrames);
        for (std::size_t i = 0; i < samples.size(); ++i)
            samples[i] = static_cast<float>(std::sin(static_cast<double>(i) * 0.01));
        for (int i = 0; i < kFiles; ++i) {
            const std::string path = folder.path() / ("sample" + std::to_string(i) + ".wav");
            made.emplace_back(path.c_str(), false);
            CAudioFileIO out;
            out.CreateAndOpenCommon(made.back(), 0, kAudioBusUndefined, 1 + i % 2, 16, 44100, kWAVE, false);
            out.WriteFrames(samples.data(), 0, kFrames);
            out.Close();
        }
        return made;
    }();
    return files;
}

bool registerAll(const std::vector<CFileRef>& files)
{
    CFileServer server(kFiles);
    return std::ranges::all_of(files, [&](const CFileRef& file) { return server.Register(1, &file) == 1; });
}

bool readAllWithSndfile(const std::vector<CFileRef>& files)
{
    std::vector<std::unique_ptr<float[]>> kept;
    return std::ranges::all_of(files, [&](const CFileRef& file) {
        SF_INFO info = {};
        SNDFILE* const opened = sf_open(file.GetPath(), SFM_READ, &info);
        kept.emplace_back(new float[static_cast<std::size_t>(info.frames * info.channels)]);
        const sf_count_t read = sf_readf_float(opened, kept.back().get(), info.frames);
        sf_close(opened);
        return read == kFrames;
    });
}

/// Both alternate; processor time, medians.
void RegisterFiles(benchmark::State& state)
{
    const std::vector<CFileRef>& files = sampleFiles();
    std::vector<double> ours, sndfile;
    if (!registerAll(files))
        state.SkipWithError("a file was not registered");
    for (auto _ : state) {
        double start = cpuSeconds();
        if (!readAllWithSndfile(files))
            state.SkipWithError("a file was not read");
        sndfile.push_back(cpuSeconds() - start);
        start = cpuSeconds();
        if (!registerAll(files))
            state.SkipWithError("a file was not registered");
        ours.push_back(cpuSeconds() - start);
        state.SetIterationTime(ours.back());
    }
    state.counters["sndfile_ms"] = 1e3 * median(sndfile);
    state.counters["ms"] = 1e3 * median(ours);
    state.counters["times_as_fast"] = median(sndfile) / median(ours); // at least 1.5
}
BENCHMARK(RegisterFiles)->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(15);

void RegisterFurtherClient(benchmark::State& state)
{
    const CFileRef& file = sampleFiles().front();
    CFileServer server(kFiles);
    server.Register(1, &file);
    server.Register(2, &file);
    for (auto _ : state)
        benchmark::DoNotOptimize(server.Register(2, &file));
}
BENCHMARK(RegisterFurtherClient);

/// The minimum for another client: checking that the file still exists.
void StatusOfTheFile(benchmark::State& state)
{
    const char* path = sampleFiles().front().GetPath();
    platform::FileStatus status;
    for (auto _ : state)
        benchmark::DoNotOptimize(platform::systemCalls().pathStatus(path, &status));
}
BENCHMARK(StatusOfTheFile);

} // namespace
