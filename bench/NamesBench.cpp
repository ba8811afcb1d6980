// Names of audio files: recognizing and cutting extensions, finding types by extension.
#include "files/AudioFileNames.h"

#include <benchmark/benchmark.h>

#include <array>
#include <cstring>
#include <string>
#include <vector>

namespace {

constexpr std::array kNames = {
    "Shaker Groove 120.aif", "Kick 01.wav", "Bass Line.L.wav", "Bass Line.R.wav", "Readme.txt", "Vocals Take 12.caf",
    "Strings.AIFF",          "Piano.mp3",   "Cover.jpeg",      "Mix.L.aif",       "Take.12",    "Guitar.m4a"};

/// Copies the name each time, because cutting changes it.
void CutKnownExtension(benchmark::State& state)
{
    std::array<std::size_t, kNames.size()> sizes;
    for (std::size_t i = 0; i < kNames.size(); ++i)
        sizes[i] = std::strlen(kNames[i]) + 1;
    std::array<char, 64> buffer;
    std::size_t next = 0;
    for (auto _ : state) {
        std::memcpy(buffer.data(), kNames[next], sizes[next]);
        benchmark::DoNotOptimize(CFileUtilCutKnownAudioFileExtension(buffer.data()));
        benchmark::ClobberMemory();
        next = next + 1 == kNames.size() ? 0 : next + 1;
    }
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(CutKnownExtension);

void StereoExtension(benchmark::State& state)
{
    std::size_t next = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(CFileUtilHasStereoExtension(kNames[next]));
        next = next + 1 == kNames.size() ? 0 : next + 1;
    }
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(StereoExtension);

void TypeByExtension(benchmark::State& state)
{
    std::vector<CFileRef> files;
    for (const char* name : kNames)
        files.emplace_back((std::string("/Users/musician/Loops/") + name).c_str(), false);
    std::size_t next = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(CFileUtilFileType(files[next]));
        next = next + 1 == files.size() ? 0 : next + 1;
    }
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(TypeByExtension);

} // namespace
