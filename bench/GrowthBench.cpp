// Growth of cost with the length of a recording and with the number of its chunks: processor time, and memory where it
// matters, at sizes ten times apart, with the exponent that fits them (1 is linear).
#include "Timing.h"
#include "audiofile/CAudioFileIO.h"
#include "audiofile/ContainerChanges.h"
#include "loops/overview/OverviewBlock.h"
#include "platform/SystemCalls.h"
#include "platform/core/ByteWriter.h"

#include <benchmark/benchmark.h>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <vector>

namespace {

/// Slope of a line through the logarithms.
double exponentOf(const std::vector<std::pair<double, double>>& points)
{
    double x = 0, y = 0, xx = 0, xy = 0;
    for (const auto& [size, cost] : points) {
        x += std::log(size);
        y += std::log(cost);
        xx += std::log(size) * std::log(size);
        xy += std::log(size) * std::log(cost);
    }
    const auto n = static_cast<double>(points.size());
    return (n * xy - x * y) / (n * xx - x * x);
}

/// A stereo WAVE (RF64) file of 16 bits at 44.1 kHz. Its samples are a hole; reads get the same second of noise from
/// memory instead, because a file of a day would have 15 GB.
class LongRecording {
public:
    explicit LongRecording(std::int64_t seconds)
        : path_(std::filesystem::temp_directory_path() / ("ktfiles-bench-" + std::to_string(getpid()) + "-long"))
    {
        const std::int64_t frames = seconds * kRate, size = frames * 4;
        ByteWriter out(std::endian::little);
        out.writeFourCC(kRF64);
        out.write(~std::uint32_t{0});
        out.writeFourCC(kWAVE);
        out.writeFourCC(kDs64);
        out.write(std::uint32_t{28});
        for (const std::int64_t field : {kHeaderSize - 8 + size, size, frames})
            out.write(static_cast<std::uint64_t>(field));
        out.write(std::uint32_t{0});
        out.writeFourCC(fourCC("fmt "));
        for (const std::uint32_t field : {16u, 0x00020001u, 44100u, 176400u, 0x00100004u})
            out.write(field);
        out.writeFourCC(kData);
        out.write(~std::uint32_t{0});
        if (static_cast<std::int64_t>(out.size()) != kHeaderSize)
            std::abort();
        std::ofstream(path_, std::ios::binary)
            .write(reinterpret_cast<const char*>(out.view().data()), static_cast<std::streamsize>(out.size()));
        std::filesystem::resize_file(path_, static_cast<std::uintmax_t>(kHeaderSize + size));
        std::mt19937 random(1);
        noise_.resize(kRate * 4);
        for (char& byte : noise_)
            byte = static_cast<char>(random());
        plain_ = platform::systemCalls();
        platform::systemCalls().pread = read;
    }
    ~LongRecording()
    {
        platform::systemCalls() = plain_;
        std::filesystem::remove(path_);
    }
    LongRecording(const LongRecording&) = delete;
    LongRecording& operator=(const LongRecording&) = delete;

    CFileRef ref() const { return CFileRef(path_.c_str(), false); }

private:
    static constexpr std::int64_t kRate = 44100, kHeaderSize = 12 + 36 + 24 + 8;

    static std::int64_t read(int descriptor, void* to, std::size_t count, std::int64_t offset)
    {
        if (offset < kHeaderSize)
            return plain_.pread(descriptor, to, count, offset);
        for (std::size_t done = 0; done < count;) {
            const std::size_t at =
                static_cast<std::size_t>(offset - kHeaderSize + static_cast<std::int64_t>(done)) % noise_.size();
            const std::size_t piece = std::min(count - done, noise_.size() - at);
            std::memcpy(static_cast<char*>(to) + done, noise_.data() + at, piece);
            done += piece;
        }
        return static_cast<std::int64_t>(count);
    }

    inline static platform::SystemCalls plain_;
    inline static std::vector<char> noise_;
    std::filesystem::path path_;
};

bool makesOverview(const LongRecording& recording)
{
    CAudioFileIO file(recording.ref(), 0);
    const auto overview = file.CreateOverview();
    return overview && overview->size() == static_cast<std::size_t>(OverviewBlockSize(file.Info().frames));
}

/// Peak memory, in MiB, of a process that makes the overview above that of one that does not.
double memoryFor(const LongRecording& recording)
{
    const auto peak = [&](bool works) {
        const pid_t child = fork();
        if (child == 0)
            std::_Exit(works && !makesOverview(recording) ? 1 : 0);
        int status = 1;
        rusage usage{};
        wait4(child, &status, 0, &usage);
        return status == 0 ? static_cast<double>(usage.ru_maxrss) / 1024 : -1e9;
    };
    const double empty = peak(false);
    return peak(true) - empty;
}

/// Overviews of a second to a day.
void OverviewsGrow(benchmark::State& state)
{
    constexpr std::array<std::pair<int, const char*>, 7> lengths{
        {{1, "1s"}, {10, "10s"}, {60, "1min"}, {600, "10min"}, {3600, "1h"}, {6 * 3600, "6h"}, {24 * 3600, "24h"}}};
    std::vector<std::pair<double, double>> points;
    for (auto _ : state) {
        points.clear();
        for (const auto& [length, name] : lengths) {
            const LongRecording recording(length);
            const int times = std::clamp(600 / length, 1, 50);
            const double taken = processorSeconds([&] {
                for (int i = 0; i < times; ++i)
                    if (!makesOverview(recording))
                        state.SkipWithError("no overview");
            });
            points.emplace_back(length, taken / times);
            state.counters[std::string("ms_") + name] = 1000 * taken / times;
            state.counters[std::string("MiB_") + name] = memoryFor(recording);
        }
    }
    state.counters["exponent"] = exponentOf(points);
    state.counters["exponent_from_10min"] = exponentOf({points.end() - 4, points.end()});
}
BENCHMARK(OverviewsGrow)->Unit(benchmark::kSecond)->Iterations(1);

constexpr FourCC kOne = fourCC("one "), kNote = fourCC("note");

/// A file with the given number of small chunks after a few samples, one of them "one " and a tenth "note"; written
/// anew for each edit.
class ManyChunks {
public:
    ManyChunks(int kind, int count)
        : path_(std::filesystem::temp_directory_path() / ("ktfiles-bench-" + std::to_string(getpid()) + "-many"))
    {
        const bool isCAF = kind == 2;
        const std::endian order = kind == 0 ? std::endian::little : std::endian::big;
        ByteWriter out(order), chunks(order);
        const auto add = [&](FourCC id, std::size_t size) {
            chunks.writeFourCC(id);
            if (isCAF)
                chunks.write(static_cast<std::uint64_t>(size));
            else
                chunks.write(static_cast<std::uint32_t>(size));
            chunks.write(Bytes(size));
        };
        if (kind == 0) {
            chunks.writeFourCC(fourCC("fmt "));
            for (const std::uint32_t field : {16u, 0x00010001u, 44100u, 88200u, 0x00100002u})
                chunks.write(field);
        } else if (kind == 1) {
            chunks.writeFourCC(fourCC("COMM"));
            for (const std::uint32_t field : {18u, 0x00010000u, 0x00040010u, 0x400EAC44u, 0u})
                chunks.write(field);
            chunks.write(std::uint16_t{0});
        } else {
            chunks.writeFourCC(fourCC("desc"));
            chunks.write(std::uint64_t{32});
            chunks.write(std::bit_cast<std::uint64_t>(44100.0));
            chunks.writeFourCC(fourCC("lpcm"));
            for (const std::uint32_t field : {0u, 2u, 1u, 1u, 16u})
                chunks.write(field);
        }
        add(kind == 1 ? fourCC("SSND") : kData, 16);
        for (int i = 0; i < count; ++i) {
            const bool isOne = i == count / 2, isNote = !isOne && i % 10 == 5;
            notes_ += isNote ? 1 : 0;
            add(isOne ? kOne : isNote ? kNote : fourCC("more"), 4);
        }
        out.writeFourCC(kind == 0 ? kRIFF : kind == 1 ? fourCC("FORM") : kCaff);
        if (isCAF)
            out.write(std::uint32_t{0x00010000});
        else
            out.write(static_cast<std::uint32_t>(chunks.size() + 4));
        if (!isCAF)
            out.writeFourCC(kind == 0 ? kWAVE : fourCC("AIFF"));
        out.write(chunks.view());
        content_.assign(out.view().begin(), out.view().end());
    }
    ~ManyChunks() { std::filesystem::remove(path_); }
    ManyChunks(const ManyChunks&) = delete;
    ManyChunks& operator=(const ManyChunks&) = delete;

    CFileRef ref() const { return CFileRef(path_.c_str(), false); }
    int notes() const { return notes_; }
    void writeAnew() const
    {
        std::ofstream(path_, std::ios::binary)
            .write(reinterpret_cast<const char*>(content_.data()), static_cast<std::streamsize>(content_.size()));
    }

private:
    std::filesystem::path path_;
    Bytes content_;
    int notes_ = 0;
};

/// Adding a chunk, removing one, and removing all of a kind, each including opening the file and checking the result;
/// with 1 to 1,000,000 chunks.
void ChunksGrow(benchmark::State& state)
{
    const auto kind = static_cast<int>(state.range(0));
    enum Edit { adding, removingOne, removingAll, edits };
    constexpr std::array<const char*, edits> names{"add", "remove", "removeAll"};
    std::vector<std::pair<double, double>> points[edits];
    for (auto _ : state) {
        for (auto& of : points)
            of.clear();
        for (int count = 1; count <= 1'000'000; count *= 10) {
            const ManyChunks file(kind, count);
            for (int edit = 0; edit < edits; ++edit) {
                const int times = std::clamp(10'000 / count, 1, 100);
                double taken = 0;
                for (int i = 0; i < times; ++i) {
                    file.writeAnew();
                    taken += processorSeconds([&] {
                        const ContainerProblem problem =
                            edit == adding        ? AddChunkTo(file.ref(), {.id = kFree, .body = bytesOf("body")})
                            : edit == removingOne ? RemoveChunksFrom(file.ref(), kOne, 1)
                                                  : RemoveChunksFrom(file.ref(), kNote, file.notes());
                        if (problem)
                            state.SkipWithError("the edit failed");
                    });
                }
                points[edit].emplace_back(count, taken / times);
                state.counters[std::string(names[static_cast<std::size_t>(edit)]) + "_ms_" + std::to_string(count)] =
                    1000 * taken / times;
            }
        }
    }
    // Only where opening the file is not most of the work.
    for (std::size_t edit = 0; edit < edits; ++edit)
        state.counters[std::string(names[edit]) + "_exponent"] =
            exponentOf({points[edit].end() - 4, points[edit].end()});
    state.SetLabel(kind == 0 ? "RIFF" : kind == 1 ? "AIFF" : "CAF");
}
BENCHMARK(ChunksGrow)->ArgName("kind")->DenseRange(0, 2)->Unit(benchmark::kSecond)->Iterations(1);

} // namespace
