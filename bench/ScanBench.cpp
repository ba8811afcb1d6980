// Scanning a folder of loops: every file is opened from its path, its chunks are listed, one is read, the file closed.
// Beside it what cannot be avoided (open, one read of 16 KiB, close), and the same work through libsndfile.
#include "audiofile/CAudioFileIO.h"
#include "platform/core/ByteWriter.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <sndfile.h>
#include <unistd.h>

#include <array>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

namespace {

constexpr int kFilesOfAKind = 2000;
constexpr std::size_t kFileSize = 64 * 1024;
constexpr std::size_t kSampleBytes = 60 * 1024;
constexpr std::size_t kChunks = 10;
constexpr FourCC kRead = fourCC("basc"); // the chunk that is read, behind the samples
constexpr std::size_t kReadSize = 82;

struct ChunkSize {
    const char (&id)[5];
    std::size_t size;
};

void putChunk(ByteWriter& out, FourCC id, BytesView body)
{
    out.writeFourCC(id);
    out.write(static_cast<std::uint32_t>(body.size()));
    out.write(body);
    out.writeZeros(body.size() & 1);
}

/// A container of `kFileSize` bytes: the format, the chunks, the last of them as long as it takes.
Bytes container(FourCC id, FourCC formType, std::endian order, FourCC formatId, const Bytes& format,
                const std::array<ChunkSize, kChunks - 1>& chunks)
{
    ByteWriter out(order);
    out.writeFourCC(id);
    out.write(static_cast<std::uint32_t>(kFileSize - 8));
    out.writeFourCC(formType);
    putChunk(out, formatId, format);
    for (const ChunkSize& chunk : chunks)
        putChunk(out, fourCC(chunk.id), Bytes(chunk.size > 0 ? chunk.size : kFileSize - out.size() - 8));
    return out.take();
}

Bytes wave()
{
    ByteWriter format(std::endian::little);
    for (const int field : {1, 2, 44100, 0, 176400 & 0xFFFF, 176400 >> 16, 4, 16})
        format.write(static_cast<std::uint16_t>(field));
    return container(kRIFF, kWAVE, std::endian::little, fourCC("fmt "), format.take(),
                     {{{"LIST", 120},
                       {"bext", 602},
                       {"cue ", 28},
                       {"data", kSampleBytes},
                       {"smpl", 60},
                       {"inst", 7},
                       {"basc", kReadSize},
                       {"cate", 210},
                       {"LGWV", 0}}});
}

Bytes aiff()
{
    ByteWriter format;
    format.write<std::uint16_t>(2);
    format.write<std::uint32_t>((kSampleBytes - 8) / 4);
    format.write<std::uint16_t>(16);
    format.write<std::uint16_t>(0x400E); // 44100 as an 80-bit extended float
    format.write<std::uint64_t>(0xAC44000000000000);
    return container(kFORM, kAIFF, std::endian::big, fourCC("COMM"), format.take(),
                     {{{"NAME", 21},
                       {"ANNO", 500},
                       {"APPL", 128},
                       {"SSND", kSampleBytes},
                       {"MARK", 2},
                       {"trns", 300},
                       {"basc", kReadSize},
                       {"cate", 210},
                       {"LGWV", 0}}});
}

/// The files, in a folder that is removed when the process ends.
class Loops {
public:
    static const std::vector<std::string>& paths()
    {
        static const Loops loops;
        return loops.paths_;
    }

private:
    Loops()
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        if (mkdtemp(pattern.data()) == nullptr)
            std::abort();
        folder_ = pattern;
        for (int i = 0; i < kFilesOfAKind; ++i) {
            add("loop" + std::to_string(i) + ".wav", wave());
            add("loop" + std::to_string(i) + ".aif", aiff());
        }
    }
    ~Loops() { std::filesystem::remove_all(folder_); }

    void add(const std::string& name, const Bytes& content)
    {
        paths_.push_back(folder_ / name);
        std::ofstream(paths_.back(), std::ios::binary)
            .write(reinterpret_cast<const char*>(content.data()), static_cast<std::streamsize>(content.size()));
        if (content.size() != kFileSize)
            std::abort();
    }

    std::filesystem::path folder_;
    std::vector<std::string> paths_;
};

// Each returns the bytes of the chunk that it read.

std::size_t touch(const std::string& path)
{
    std::array<char, 16 * 1024> start;
    const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    const ssize_t got = pread(descriptor, start.data(), start.size(), 0);
    close(descriptor);
    return got == ssize_t{start.size()} ? kReadSize : 0;
}

std::size_t scan(const std::string& path)
{
    CAudioFileIO file;
    if (file.Open(CFileRef(path.c_str(), false), 0) != kStatusOK)
        return 0;
    std::size_t chunks = 0;
    file.ForEachChunk([&](const ChunkEntry&) { return ++chunks, true; });
    CChunkData chunk;
    return file.FindChunk(kRead, chunk) == 1 && chunks == kChunks ? static_cast<std::size_t>(chunk.size) : 0;
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
    return read && chunks == kChunks + 1 ? chunk.datalen : 0; // it counts the container too
}

double cpuSeconds()
{
    timespec now{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

/// The processor time of one pass over all files.
template <class Road>
double pass(benchmark::State& state, const char* name, Road road)
{
    const double start = cpuSeconds();
    for (const std::string& path : Loops::paths()) {
        if (road(path) != kReadSize)
            state.SkipWithError(name);
    }
    return cpuSeconds() - start;
}

/// The roads take turns, so that page cache and processor treat them alike. The time of the benchmark is that of our
/// own.
void ScanLoops(benchmark::State& state)
{
    const auto files = static_cast<double>(Loops::paths().size());
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
