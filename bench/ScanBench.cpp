// Scanning a folder of loops: opens every file by its path, lists its chunks, reads one, closes the file. Compared with
// the minimum (open, one read of 16 KiB, close), and with the same work in libsndfile.
#include "LoopFiles.h"
#include "audiofile/CAudioFileIO.h"

#include <benchmark/benchmark.h>
#include <sndfile.h>

#include <array>

namespace {

constexpr int kFilesOfAKind = 2000;
constexpr FourCC kRead = fourCC("basc"); // the chunk to read, after the samples
constexpr std::size_t kReadSize = 82;

/// The files, half of them WAVE, half AIFF.
const std::vector<std::string>& loopPaths()
{
    static const BenchFolder folder;
    static const std::vector<std::string> paths = [] {
        std::vector<std::string> made;
        for (int i = 0; i < kFilesOfAKind; ++i) {
            made.push_back(folder.write("loop" + std::to_string(i) + ".wav", waveLoop()));
            made.push_back(folder.write("loop" + std::to_string(i) + ".aif", aiffLoop()));
        }
        return made;
    }();
    return paths;
}

// Each returns the size of the chunk that it read.

std::size_t touch(const std::string& path)
{
    return openReadClose(path) ? kReadSize : 0;
}

std::size_t scan(const std::string& path)
{
    CAudioFileIO file;
    if (file.Open(CFileRef(path.c_str(), false), 0) != kStatusOK)
        return 0;
    std::size_t chunks = 0;
    file.ForEachChunk([&](const ChunkEntry&) { return ++chunks, true; });
    CChunkData chunk;
    return file.FindChunk(kRead, chunk) == 1 && chunks == kLoopChunks ? static_cast<std::size_t>(chunk.size) : 0;
}

std::size_t scanWithSndfile(const std::string& path)
{
    SF_INFO info{};
    SNDFILE* file = sf_open(path.c_str(), SFM_READ, &info);
    if (file == nullptr)
        return 0;
    std::size_t chunks = 0;
    SF_CHUNK_INFO chunk{};
    for (SF_CHUNK_ITERATOR* at = sf_get_chunk_iterator(file, nullptr); at != nullptr; at = sf_next_chunk_iterator(at))
        chunks += sf_get_chunk_size(at, &chunk) == SF_ERR_NO_ERROR;
    std::array<char, kReadSize> body;
    chunk = {"basc", 4, body.size(), body.data()};
    const bool read = sf_get_chunk_data(sf_get_chunk_iterator(file, &chunk), &chunk) == SF_ERR_NO_ERROR;
    sf_close(file);
    return read && chunks == kLoopChunks + 1 ? chunk.datalen : 0; // it counts the container as a chunk
}

/// Processor time of one pass over all files.
template <class Road>
double pass(benchmark::State& state, const char* name, Road road)
{
    const double start = cpuSeconds();
    for (const std::string& path : loopPaths()) {
        if (road(path) != kReadSize)
            state.SkipWithError(name);
    }
    return cpuSeconds() - start;
}

/// The ways alternate, so that page cache and processor treat them alike. The benchmark's time is ours.
void ScanLoops(benchmark::State& state)
{
    const auto files = static_cast<double>(loopPaths().size());
    double bare = 0, ours = 0, sndfile = 0;
    pass(state, "open, read, close failed", touch);
    for (auto _ : state) {
        bare += pass(state, "open, read, close failed", touch);
        sndfile += pass(state, "libsndfile failed", scanWithSndfile);
        const double seconds = pass(state, "the scan failed", scan);
        ours += seconds;
        state.SetIterationTime(seconds);
    }
    const double perFile = 1e6 / files / static_cast<double>(state.iterations());
    state.counters["bare_us_per_file"] = bare * perFile;
    state.counters["us_per_file"] = ours * perFile;
    state.counters["sndfile_us_per_file"] = sndfile * perFile;
    state.counters["times_bare"] = ours / bare;                  // at most 1.5
    state.counters["times_as_fast_as_sndfile"] = sndfile / ours; // at least 3
}
BENCHMARK(ScanLoops)->UseManualTime()->Unit(benchmark::kMillisecond)->MinTime(2);

} // namespace
