// Drawing a waveform of 1,800 x 280 as PNG and SVG, from the stored overview of a 10-minute file, read each time, and
// from one of 12 hours in memory.
#include "audiofile/CAudioFileIO.h"
#include "loops/overview/StoredOverview.h"
#include "tool/overview/PNGPicture.h"
#include "tool/overview/SVGPicture.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <string>

namespace {

constexpr double kRate = 48000;

/// Swelling and fading noise, as irregular as music: every column ends at another height.
KTMem noisyOverview(std::int64_t frames)
{
    KTMem block(OverviewBlockSize(frames));
    SetOverviewFrames(block, frames);
    std::minstd_rand random(1);
    std::uniform_real_distribution<double> noise(0.1, 1);
    const auto count = static_cast<double>(OverviewPoints(block));
    OverviewPoint* const points = OverviewPointsOf(block);
    for (std::size_t i = 0; i < OverviewPoints(block); ++i) {
        const double loud = 127 * (0.55 + 0.45 * std::sin(static_cast<double>(i) / count * 60));
        points[i].minimum = static_cast<std::int8_t>(-loud * noise(random));
        points[i].maximum = static_cast<std::int8_t>(loud * noise(random));
    }
    return block;
}

WaveformPicture drawn(const KTMem& block, const PictureSettings& settings = {})
{
    const Waveform waveform{{OverviewPointsOf(block), OverviewPoints(block)}, OverviewFrames(block), kRate};
    const PictureFrame frame(settings, {});
    const auto frames = static_cast<double>(waveform.frames);
    return pictureOf(frame, drawnPoints(waveform, 0, frames, {}, frame), settings);
}

/// A WAVE file of mono 16-bit silence that holds an overview of noise.
class FileWithOverview {
public:
    explicit FileWithOverview(std::int64_t frames)
        : path_(std::filesystem::temp_directory_path() / "ktfiles-picture-bench.wav")
    {
        CAudioFileIO file;
        KTMem block = noisyOverview(frames);
        bool stored = false;
        if (file.CreateAndOpenCommon(reference(), 0, kAudioBusMono, 1, 16, static_cast<long>(kRate), kWAVE, false) !=
                0 ||
            file.SetNumFrames(frames) != 0 || file.Close() != 0 ||
            WriteOverviewToAudioFile(reference(), &block, 0, &stored) != 0 || !stored)
            std::abort();
    }
    ~FileWithOverview() { std::filesystem::remove(path_); }
    FileWithOverview(const FileWithOverview&) = delete;
    FileWithOverview& operator=(const FileWithOverview&) = delete;

    CFileRef reference() const { return {path_.c_str(), false}; }

private:
    std::filesystem::path path_;
};

void drawPNGFromStored(benchmark::State& state)
{
    const FileWithOverview file(static_cast<std::int64_t>(kRate) * 600);
    for (auto _ : state) {
        const std::unique_ptr<KTMem> block = ReadOverviewFromAudioFile(file.reference(), 0);
        benchmark::DoNotOptimize(pngOf(drawn(*block), defaultColors()));
    }
}
BENCHMARK(drawPNGFromStored)->Unit(benchmark::kMillisecond);

void drawPNGOfTwelveHours(benchmark::State& state)
{
    const KTMem block = noisyOverview(static_cast<std::int64_t>(kRate) * 3600 * 12);
    PictureSettings settings;
    settings.scale = true;
    for (auto _ : state)
        benchmark::DoNotOptimize(pngOf(drawn(block, settings), defaultColors()));
}
BENCHMARK(drawPNGOfTwelveHours)->Unit(benchmark::kMillisecond);

void drawSVGOfTwelveHours(benchmark::State& state)
{
    const KTMem block = noisyOverview(static_cast<std::int64_t>(kRate) * 3600 * 12);
    for (auto _ : state)
        benchmark::DoNotOptimize(svgOf(drawn(block), defaultColors(), "twelve hours"));
}
BENCHMARK(drawSVGOfTwelveHours)->Unit(benchmark::kMillisecond);

} // namespace
