// Reading and writing files: the overhead of CFileIO above its system calls.
#include "files/CFileIO.h"
#include "platform/core/CRC32.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

namespace {

constexpr long kMiB = 1048576;
constexpr long long kMovedSize = 1024LL * kMiB;
constexpr long long kDistance = 4096; // the size of a chunk, as when a tag is inserted before the samples

/// A file in the temporary folder, filled piece by piece, removed at the end.
class ScratchFile {
public:
    explicit ScratchFile(long long size) : path_(std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX")
    {
        std::string pattern = path_;
        const int descriptor = mkstemp(pattern.data());
        path_ = pattern;
        const std::vector<char> piece(kMiB, 'x');
        for (long long at = 0; at < size; at += kMiB)
            if (pwrite(descriptor, piece.data(), static_cast<size_t>(std::min<long long>(kMiB, size - at)), at) < 0)
                std::abort();
        fsync(descriptor);
        close(descriptor);
    }
    ~ScratchFile() { std::filesystem::remove(path_); }
    ScratchFile(const ScratchFile&) = delete;
    ScratchFile& operator=(const ScratchFile&) = delete;
    const std::string& path() const { return path_; }

private:
    std::string path_;
};

/// Moves up and down again, so that the file is unchanged. Both ways alternate on one file, so that page cache and disk
/// treat them alike.
void moveBySystemCalls(int descriptor, long long from, long long to, std::vector<char>& buffer)
{
    const long long distance = to - from;
    const long long end = lseek(descriptor, 0, SEEK_END);
    if (distance > 0 && ftruncate(descriptor, end + distance) != 0)
        std::abort();
    for (long long done = 0; done < end - from;) {
        const long long piece = std::min<long long>(kMiB, end - from - done);
        const long long at = distance > 0 ? end - done - piece : from + done;
        if (pread(descriptor, buffer.data(), static_cast<size_t>(piece), at) != piece ||
            pwrite(descriptor, buffer.data(), static_cast<size_t>(piece), at + distance) != piece)
            std::abort();
        done += piece;
    }
    if (distance < 0 && ftruncate(descriptor, end + distance) != 0)
        std::abort();
}

void BM_MoveBySystemCalls(benchmark::State& state)
{
    const ScratchFile file(kMovedSize);
    const int descriptor = open(file.path().c_str(), O_RDWR | O_CLOEXEC);
    std::vector<char> buffer(kMiB);
    for (auto _ : state) {
        moveBySystemCalls(descriptor, 0, kDistance, buffer);
        moveBySystemCalls(descriptor, kDistance, 0, buffer);
    }
    close(descriptor);
    state.SetBytesProcessed(state.iterations() * 2 * kMovedSize);
}
BENCHMARK(BM_MoveBySystemCalls)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);

void BM_BlockMove(benchmark::State& state)
{
    const ScratchFile file(kMovedSize);
    CFileIO io(CFileRef(file.path().c_str(), false), kFileIOReadWrite);
    for (auto _ : state) {
        if (io.BlockMove(0, kDistance) != kStatusOK || io.BlockMove(kDistance, 0) != kStatusOK)
            state.SkipWithError("BlockMove failed");
    }
    state.SetBytesProcessed(state.iterations() * 2 * kMovedSize);
}
BENCHMARK(BM_BlockMove)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);

void BM_CRCOfFile(benchmark::State& state)
{
    const ScratchFile file(64 * kMiB);
    CFileIO io(CFileRef(file.path().c_str(), false), 0);
    for (auto _ : state) {
        io.SetMark(0);
        benchmark::DoNotOptimize(io.CRC());
    }
    state.SetBytesProcessed(state.iterations() * 64 * kMiB);
}
BENCHMARK(BM_CRCOfFile)->Unit(benchmark::kMillisecond);

void BM_CRCInCache(benchmark::State& state)
{
    const std::vector<char> bytes(10240, 'x');
    std::uint32_t crc = 0;
    for (auto _ : state)
        benchmark::DoNotOptimize(crc = ECCRC32(crc, bytes.data(), bytes.size()));
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(bytes.size()));
}
BENCHMARK(BM_CRCInCache);

// A sampler's folder: many loops of 64 KiB opened in turn.

constexpr int kLoops = 1000;
constexpr long kLoopSize = 65536;

class LoopFolder {
public:
    LoopFolder()
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        path_ = mkdtemp(pattern.data());
        const std::vector<char> bytes(kLoopSize, 'x');
        for (int i = 0; i < kLoops; ++i) {
            files_.push_back(path_ / ("loop" + std::to_string(i) + ".wav"));
            const int descriptor = open(files_.back().c_str(), O_CREAT | O_WRONLY, 0600);
            if (pwrite(descriptor, bytes.data(), bytes.size(), 0) != kLoopSize)
                std::abort();
            close(descriptor);
        }
    }
    ~LoopFolder() { std::filesystem::remove_all(path_); }
    LoopFolder(const LoopFolder&) = delete;
    LoopFolder& operator=(const LoopFolder&) = delete;
    const std::vector<std::string>& files() const { return files_; }

private:
    std::filesystem::path path_;
    std::vector<std::string> files_;
};

void BM_OpenReadCloseBySystemCalls(benchmark::State& state)
{
    const LoopFolder folder;
    std::vector<char> buffer(16384);
    for (auto _ : state) {
        for (const std::string& path : folder.files()) {
            const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
            benchmark::DoNotOptimize(pread(descriptor, buffer.data(), buffer.size(), 0));
            close(descriptor);
        }
    }
    state.SetItemsProcessed(state.iterations() * kLoops);
}
BENCHMARK(BM_OpenReadCloseBySystemCalls)->Unit(benchmark::kMicrosecond);

/// With a reference made from each path and ten small reads through a cache of 16 KiB.
void BM_OpenReadClose(benchmark::State& state)
{
    const LoopFolder folder;
    const auto cache = std::make_shared<KTMem>(16384);
    char header[12];
    for (auto _ : state) {
        for (const std::string& path : folder.files()) {
            CFileIO io;
            io.SetCache(cache);
            if (io.Open(CFileRef(path.c_str(), false), 0) != kStatusOK)
                state.SkipWithError("Open failed");
            for (int i = 0; i < 10; ++i)
                benchmark::DoNotOptimize(io.Read(header, i * 1000, sizeof header, nullptr));
        }
    }
    state.SetItemsProcessed(state.iterations() * kLoops);
}
BENCHMARK(BM_OpenReadClose)->Unit(benchmark::kMicrosecond);

} // namespace
