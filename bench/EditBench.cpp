// In-place edits of a file of 1 GiB, whose cost must not depend on the samples, and safe edits, whose cost must not
// depend on other files in the folder.
#include "Timing.h"
#include "audiofile/CAudioFileIO.h"
#include "audiofile/CContainerEdit.h"
#include "audiofile/ContainerChanges.h"
#include "platform/OwnedDescriptor.h"
#include "platform/core/ByteWriter.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <time.h>
#include <vector>

namespace {

constexpr std::int64_t kDataSize = 1LL << 30;
constexpr FourCC kNote = fourCC("note");
constexpr std::array<std::byte, 1024> kBody{};
constexpr std::size_t kStart = 12 + 24 + 8 + 1024 + 8;

/// A WAVE file with a chunk of 1 KiB before its samples, which are a hole of `dataSize` bytes. Removed at the end.
class LargeFile {
public:
    explicit LargeFile(std::int64_t dataSize = kDataSize) : length_(static_cast<std::int64_t>(kStart) + dataSize)
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

    /// Restores the file, as far as the edits below change it.
    void restore() const
    {
        ByteWriter size(std::endian::little);
        size.write(static_cast<std::uint32_t>(length_ - 8));
        if (ftruncate(descriptor_, length_) != 0 || pwrite(descriptor_, "note", 4, 36) != 4 ||
            pwrite(descriptor_, size.view().data(), size.size(), 4) != 4)
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

/// Adds 1 KiB after the samples of files that were just opened and last changed a while ago, compared with the
/// indispensable calls (is it still the file that was opened, the chunk, the container's size) and with a single write;
/// in turns, each on its own file.
void AddBehindSamples(benchmark::State& state)
{
    constexpr std::size_t count = 150;
    const std::vector<LargeFile> files(count);
    std::array<std::byte, 8 + kBody.size()> chunk{};
    std::array<std::byte, 12> header{};
    const auto write = [&](int descriptor, const auto& bytes, std::int64_t position) {
        if (pwrite(descriptor, bytes.data(), bytes.size(), position) != static_cast<ssize_t>(bytes.size()))
            state.SkipWithError("pwrite failed");
    };
    enum Way { ours, threeCalls, onePwrite, ways };
    std::vector<double> times[ways];
    std::size_t next = 0;
    for (auto _ : state) {
        if (next % count == 0) {
            std::for_each(files.begin(), files.end(), [](const LargeFile& file) { file.restore(); });
            std::this_thread::sleep_for(std::chrono::milliseconds(3100));
        }
        for (std::size_t turn = 0; turn < ways; ++turn) {
            const auto way = static_cast<Way>((turn + next / ways) % ways);
            const LargeFile& file = files[next % count + turn];
            CAudioFileIO audio(file.ref(), kFileIOReadWrite);
            const platform::OwnedDescriptor bare(open(file.path().c_str(), O_RDWR | O_CLOEXEC));
            if (pread(bare.get(), header.data(), header.size(), 0) != ssize_t{header.size()})
                state.SkipWithError("pread failed");
            times[way].push_back(seconds([&] {
                struct statx status = {};
                if (way == ours) {
                    if (audio.AddChunk(kNote, kBody.data(), kBody.size(), false) != 1)
                        state.SkipWithError("AddChunk failed");
                    return;
                }
                if (way == threeCalls && statx(bare.get(), "", AT_EMPTY_PATH, STATX_BASIC_STATS, &status) != 0)
                    state.SkipWithError("statx failed");
                write(bare.get(), chunk, file.length());
                if (way == threeCalls)
                    write(bare.get(), header, 0);
            }));
        }
        next += ways;
        state.SetIterationTime(times[ours].back());
    }
    state.counters["bare_us"] = 1e6 * median(times[threeCalls]);
    state.counters["median_us"] = 1e6 * median(times[ours]);
    state.counters["times_bare"] = median(times[ours]) / median(times[threeCalls]); // at most 1.1
    state.counters["times_pwrite"] = median(times[ours]) / median(times[onePwrite]);
}
BENCHMARK(AddBehindSamples)->UseManualTime()->Unit(benchmark::kMicrosecond)->Iterations(500);

/// A chunk before the samples, whose size is the argument: the time must not depend on it.
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

/// A folder with a loop of 64 KiB among the given number of other files. Removed at the end.
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
        for (int i = 0; i < others; ++i) // links enlarge the folder quickly
            std::filesystem::create_hard_link(folder_ / "another loop.wav",
                                              folder_ / ("another loop " + std::to_string(i) + ".wav"));
        if (const int folder = open(folder_.c_str(), O_RDONLY | O_CLOEXEC); folder >= 0) {
            syncfs(folder); // the folder's creation must be on the disk already
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

    /// The indispensable calls of such an edit: write the new content under a temporary name, commit it, rename it.
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

/// An edit on a copy, with its syncs, in a folder with 40,000 more files, compared with an empty folder and with the
/// bare calls in both; in turns.
void SafeEditInFolder(benchmark::State& state)
{
    const LoopFolder folders[] = {LoopFolder(0), LoopFolder(40'000)};
    std::vector<double> ours[2], bare[2], processor[2];
    for (auto _ : state) {
        for (const int i : {0, 1}) {
            const double before = secondsOn(CLOCK_THREAD_CPUTIME_ID);
            ours[i].push_back(seconds([&] {
                if (!folders[i].editSafely())
                    state.SkipWithError("the edit failed");
            }));
            processor[i].push_back(secondsOn(CLOCK_THREAD_CPUTIME_ID) - before);
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
