// Edits in place of a file of 1 GiB, whose cost must not depend on the samples, and safe edits, whose cost must not
// depend on what else is in the folder.
#include "audiofile/CAudioFileIO.h"
#include "audiofile/CContainerEdit.h"
#include "audiofile/ContainerChanges.h"
#include "platform/core/ByteWriter.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <time.h>
#include <vector>

namespace {

constexpr std::int64_t kDataSize = 1LL << 30;
constexpr FourCC kNote = fourCC("note");
constexpr std::array<std::byte, 1024> kBody{};
constexpr std::size_t kStart = 12 + 24 + 8 + 1024 + 8;

/// A WAVE file with a chunk of 1 KiB ahead of its samples, which are a hole of `dataSize` bytes. Removed at the end.
class LargeFile {
public:
    explicit LargeFile(std::int64_t dataSize) : length_(static_cast<std::int64_t>(kStart) + dataSize)
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        descriptor_ = mkstemp(pattern.data());
        path_ = pattern;
        ByteWriter out(std::endian::little);
        out.writeFourCC(kRIFF);
        out.write(static_cast<std::uint32_t>(length_ - 8));
        out.writeFourCC(kWAVE);
        out.writeFourCC(fourCC("fmt "));
        for (const std::uint32_t field : {16u, 0x00010001u, 44100u, 88200u, 0x00100002u})
            out.write(field);
        out.writeFourCC(kNote);
        out.write(std::uint32_t{1024});
        out.write(kBody);
        out.writeFourCC(kData);
        out.write(static_cast<std::uint32_t>(dataSize));
        if (pwrite(descriptor_, out.view().data(), out.size(), 0) != ssize_t{kStart} || out.size() != kStart)
            std::abort();
        restore();
    }
    ~LargeFile()
    {
        close(descriptor_);
        std::filesystem::remove(path_);
    }
    LargeFile(const LargeFile&) = delete;
    LargeFile& operator=(const LargeFile&) = delete;

    /// As it was made, as far as the edits below change it.
    void restore()
    {
        if (ftruncate(descriptor_, length_) != 0 || pwrite(descriptor_, "note", 4, 36) != 4)
            std::abort();
    }
    int descriptor() const { return descriptor_; }
    std::int64_t length() const { return length_; }
    const std::filesystem::path& path() const { return path_; }
    CFileRef ref() const { return CFileRef(path_.c_str(), false); }

private:
    std::int64_t length_;
    int descriptor_ = -1;
    std::filesystem::path path_;
};

double processorTime()
{
    timespec now = {};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + 1e-9 * static_cast<double>(now.tv_nsec);
}

template <class Work>
double seconds(Work work)
{
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

double median(std::vector<double> times)
{
    const auto middle = times.begin() + static_cast<std::ptrdiff_t>(times.size() / 2);
    std::nth_element(times.begin(), middle, times.end());
    return *middle;
}

/// 1 KiB put behind the samples, beside one write of as many bytes by the system call: both on an open file.
void AddBehindSamples(benchmark::State& state)
{
    LargeFile file(kDataSize);
    CAudioFileIO audio(file.ref(), kFileIOReadWrite);
    std::array<std::byte, 8 + kBody.size()> chunk{};
    double bare = 0, ours = 0;
    for (auto _ : state) {
        bare += seconds([&] {
            if (pwrite(file.descriptor(), chunk.data(), chunk.size(), file.length()) != ssize_t{chunk.size()})
                state.SkipWithError("pwrite failed");
        });
        file.restore();
        ContainerChkExtended header;
        audio.ReadExtendedFileHeader(header);
        header.SetSize(file.length() - 8);
        header.ByteOrder();
        audio.Write(&header, 0, 12);
        const double taken = seconds([&] {
            if (audio.AddChunk(kNote, kBody.data(), kBody.size(), false) != 1)
                state.SkipWithError("AddChunk failed");
        });
        ours += taken;
        state.SetIterationTime(taken);
        file.restore();
    }
    state.counters["bare_us"] = 1e6 * bare / static_cast<double>(state.iterations());
    state.counters["times_bare"] = ours / bare; // at most 3
}
BENCHMARK(AddBehindSamples)->UseManualTime()->Unit(benchmark::kMicrosecond)->MinTime(1);

/// A chunk ahead of the samples, of which there are as many bytes as the argument says: the time must be the same.
void RemoveAheadOfSamples(benchmark::State& state)
{
    LargeFile file(state.range(0));
    for (auto _ : state) {
        CAudioFileIO audio(file.ref(), kFileIOReadWrite);
        state.SetIterationTime(seconds([&] {
            if (audio.RemoveChunk(kNote) != 0)
                state.SkipWithError("RemoveChunk failed");
        }));
        file.restore();
    }
}
BENCHMARK(RemoveAheadOfSamples)
    ->Arg(1 << 16)
    ->Arg(kDataSize)
    ->UseManualTime()
    ->Unit(benchmark::kMicrosecond)
    ->MinTime(0.5);

/// A folder with a loop of 64 KiB, among as many others as are asked for. Removed at the end.
class LoopFolder {
public:
    explicit LoopFolder(int others)
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        folder_ = mkdtemp(pattern.data());
        loop_ = folder_ / "loop.wav";
        const LargeFile loop(1 << 16);
        std::filesystem::copy_file(loop.path(), loop_);
        std::ofstream(folder_ / "another loop.wav") << "RIFF";
        for (int i = 0; i < others; ++i) // further names make the folder as large, and are made in no time
            std::filesystem::create_hard_link(folder_ / "another loop.wav",
                                              folder_ / ("another loop " + std::to_string(i) + ".wav"));
        if (const int folder = open(folder_.c_str(), O_RDONLY | O_CLOEXEC); folder >= 0) {
            syncfs(folder); // a folder as it lies there, not one whose making is still to be written down
            close(folder);
        }
    }
    ~LoopFolder() { std::filesystem::remove_all(folder_); }
    LoopFolder(const LoopFolder&) = delete;
    LoopFolder& operator=(const LoopFolder&) = delete;

    const std::filesystem::path& loop() const { return loop_; }

    bool editSafely() const
    {
        CContainerEdit edit;
        return !edit.Begin(loop_) && !edit.Apply(EditScope::chunk(kNote), [](const std::string& copy) {
            return AddChunkTo(CFileRef(copy.c_str(), false), {.id = kNote, .body = kBody, .replaces = true}).Status();
        });
    }

    /// The calls that such an edit cannot do without: the new content under a name of its own, committed, and renamed.
    bool replaceBare() const
    {
        const int folder = open(folder_.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        const int original = openat(folder, "loop.wav", O_RDONLY | O_CLOEXEC);
        const int copy = openat(folder, ".new", O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
        const off_t length = lseek(original, 0, SEEK_END);
        off_t from = 0, to = 0;
        const bool done = copy_file_range(original, &from, copy, &to, static_cast<std::size_t>(length), 0) == length &&
                          pwrite(copy, kBody.data(), kBody.size(), length - off_t{kBody.size()}) > 0 &&
                          fsync(copy) == 0 && renameat(folder, ".new", folder, "loop.wav") == 0 && fsync(folder) == 0;
        for (const int descriptor : {original, copy, folder})
            close(descriptor);
        return done;
    }

private:
    std::filesystem::path folder_, loop_;
};

/// An edit on a copy, with its syncs, in a folder with 40,000 files more, beside the same in an empty one, and beside
/// the bare calls in both; in turns.
void SafeEditInFolder(benchmark::State& state)
{
    const LoopFolder folders[] = {LoopFolder(0), LoopFolder(40'000)};
    std::vector<double> ours[2], bare[2], processor[2];
    for (auto _ : state) {
        for (const int i : {0, 1}) {
            const double before = processorTime();
            ours[i].push_back(seconds([&] {
                if (!folders[i].editSafely())
                    state.SkipWithError("the edit failed");
            }));
            processor[i].push_back(processorTime() - before);
            bare[i].push_back(seconds([&] {
                if (!folders[i].replaceBare())
                    state.SkipWithError("the bare calls failed");
            }));
        }
        state.SetIterationTime(ours[1].back());
    }
    state.counters["median_us"] = 1e6 * median(ours[1]);
    state.counters["times_empty"] = median(ours[1]) / median(ours[0]);               // at most 1.2
    state.counters["cpu_times_empty"] = median(processor[1]) / median(processor[0]); // the same
    state.counters["bare_times_empty"] = median(bare[1]) / median(bare[0]);
    state.counters["times_bare"] = median(ours[1]) / median(bare[1]);
}
BENCHMARK(SafeEditInFolder)->UseManualTime()->Unit(benchmark::kMicrosecond)->Iterations(300);

} // namespace
