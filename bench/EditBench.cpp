// Edits of a file of 1 GiB in place: their cost must not depend on the samples.
#include "audiofile/CAudioFileIO.h"
#include "platform/core/ByteWriter.h"

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <string>

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
    CFileRef ref() const { return CFileRef(path_.c_str(), false); }

private:
    std::int64_t length_;
    int descriptor_ = -1;
    std::filesystem::path path_;
};

template <class Work>
double seconds(Work work)
{
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
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

} // namespace
