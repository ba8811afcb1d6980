// Streams in blocks of 512 frames, as in an audio engine, compared with CAudioFileIO reading the same blocks.
#include "audiofile/CAudioFileIO.h"
#include "audiofile/XStream.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <vector>

namespace {

constexpr long kBlock = 512;
constexpr long kFrames = 44100 * 60;
constexpr int kChannels = 2;

struct Kind {
    FourCC type;
    int bits;
    const char* name;
};
constexpr Kind kinds[] = {{fourCC("WAVE"), 16, "16-bit WAV"},
                          {fourCC("WAVE"), 24, "24-bit WAV"},
                          {fourCC("AIFF"), 16, "16-bit AIFF"},
                          {fourCC("caff"), -32, "float CAF"}};

/// A minute of stereo, removed at the end.
class SoundOfAMinute {
public:
    explicit SoundOfAMinute(const Kind& kind)
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        folder_ = mkdtemp(pattern.data());
        CAudioFileIO file;
        if (file.CreateAndOpenCommon(reference(), 0, TAudioBusFormat{}, kChannels, kind.bits, 44100, kind.type,
                                     false) != 0)
            std::abort();
        std::vector<float> samples(kFrames * kChannels);
        for (std::size_t i = 0; i < samples.size(); ++i)
            samples[i] = static_cast<float>(std::sin(static_cast<double>(i) * 0.01)) * 0.9F;
        if (file.WriteFrames(samples.data(), 0, kFrames) != 0 || file.Close() != 0)
            std::abort();
    }
    ~SoundOfAMinute() { std::filesystem::remove_all(folder_); }
    SoundOfAMinute(const SoundOfAMinute&) = delete;
    SoundOfAMinute& operator=(const SoundOfAMinute&) = delete;
    CFileRef reference() const { return CFileRef((folder_ / "sound").c_str(), false); }

private:
    std::filesystem::path folder_;
};

void BM_ReadBlocksOfAudioFile(benchmark::State& state)
{
    const Kind& kind = kinds[state.range(0)];
    const SoundOfAMinute sound(kind);
    CAudioFileIO file(sound.reference(), 0);
    std::vector<float> block(kBlock * kChannels);
    for (auto _ : state)
        for (long frame = 0; frame + kBlock <= kFrames; frame += kBlock)
            if (file.ReadFrames(block.data(), frame, kBlock) != 0)
                state.SkipWithError("ReadFrames failed");
    state.SetItemsProcessed(state.iterations() * kFrames);
    state.SetLabel(kind.name);
}
BENCHMARK(BM_ReadBlocksOfAudioFile)->ArgName("kind")->DenseRange(0, 3)->Unit(benchmark::kMillisecond);

void BM_ReadBlocksOfStream(benchmark::State& state)
{
    const Kind& kind = kinds[state.range(0)];
    const SoundOfAMinute sound(kind);
    const XStreamDescription client{44100, fourCC("lpcm"), 9, 8, 1, 8, kChannels, 32, 0};
    XStreamRef stream = nullptr;
    if (XStreamOpenWithFileRef(sound.reference(), 0, 0, 0, &client, nullptr, &stream) != 0)
        state.SkipWithError("XStreamOpen failed");
    std::vector<float> block(kBlock * kChannels);
    for (auto _ : state)
        for (long frame = 0; frame + kBlock <= kFrames; frame += kBlock)
            if (XStreamReadFramesSync(stream, frame, kBlock, nullptr, block.data(), nullptr) != 0)
                state.SkipWithError("XStreamReadFramesSync failed");
    XStreamClose(stream);
    state.SetItemsProcessed(state.iterations() * kFrames);
    state.SetLabel(kind.name);
}
BENCHMARK(BM_ReadBlocksOfStream)->ArgName("kind")->DenseRange(0, 3)->Unit(benchmark::kMillisecond);

void BM_ReadBlocksAtAnotherRate(benchmark::State& state)
{
    const SoundOfAMinute sound(kinds[0]);
    const auto rate = static_cast<double>(state.range(0));
    const XStreamDescription client{rate, fourCC("lpcm"), 9, 8, 1, 8, kChannels, 32, 0};
    XStreamRef stream = nullptr;
    if (XStreamOpenWithFileRef(sound.reference(), 0, 0, 0, &client, nullptr, &stream) != 0)
        state.SkipWithError("XStreamOpen failed");
    std::vector<float> block(kBlock * kChannels);
    for (auto _ : state)
        for (std::int64_t frame = 0; frame + kBlock <= static_cast<std::int64_t>(rate * 60); frame += kBlock)
            if (XStreamReadFramesSync(stream, frame, kBlock, nullptr, block.data(), nullptr) != 0)
                state.SkipWithError("XStreamReadFramesSync failed");
    XStreamClose(stream);
    state.SetItemsProcessed(state.iterations() * kFrames);
}
BENCHMARK(BM_ReadBlocksAtAnotherRate)
    ->ArgName("rate")
    ->Arg(48000)
    ->Arg(44099)
    ->Arg(22050)
    ->Unit(benchmark::kMillisecond);

} // namespace
