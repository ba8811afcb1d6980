// An hour of compressed sound decoded from end to end, compared with the ffmpeg command; seeks in it; and what a
// process pays for the library without ever decoding.
#include "Timing.h"
#include "audiofile/XStream.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <spawn.h>
#include <string>
#include <sys/resource.h>
#include <sys/wait.h>
#include <vector>

extern char** environ;

namespace {

constexpr std::uint32_t kBlock = 4096;

/// Twelve copies of the same five minutes, made once and removed at the end of the process.
class Hours {
public:
    static const Hours& shared()
    {
        static const Hours hours;
        return hours;
    }
    std::string path(int kind) const { return folder_ / (kind == 0 ? "hour.mp3" : "hour.m4a"); }

private:
    Hours()
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        folder_ = mkdtemp(pattern.data());
        const std::string sound =
            "aevalsrc='0.3*sin(440*2*PI*t)*(0.6+0.4*sin(t))+0.2*(random(0)-0.5)*gt(mod(t\\,3)\\,2)|"
            "0.3*sin(550*2*PI*t)+0.1*sin(3520*2*PI*t)*gt(mod(t\\,5)\\,3)':d=300:s=44100";
        run("ffmpeg -f lavfi -i \"" + sound + "\" five.wav");
        run("lame --quiet -V 2 five.wav five.mp3");
        run("ffmpeg -i five.wav -c:a aac -b:a 160k five.aac");
        for (const char* type : {"mp3", "aac"})
            run(std::string("ffmpeg -stream_loop 11 -i five.") + type + " -c copy hour." + type);
        run("ffmpeg -i hour.aac -c copy hour.m4a");
    }
    ~Hours() { std::filesystem::remove_all(folder_); }
    void run(const std::string& command) const
    {
        if (std::system(("cd '" + folder_.string() + "' && " + command + " >/dev/null 2>&1 </dev/null").c_str()) != 0)
            std::abort();
    }

    std::filesystem::path folder_;
};

XStreamRef openFloats(const std::string& path)
{
    const XStreamDescription client{44100, 0x6C70636D, 9, 8, 1, 8, 2, 32, 0}; // "lpcm"
    XStreamRef stream = nullptr;
    return XStreamOpen(path.c_str(), 0, 0, 0, &client, nullptr, &stream) == 0 ? stream : nullptr;
}

/// Number of frames decoded from the whole file.
std::int64_t decode(const std::string& path)
{
    std::vector<float> block(kBlock * 2);
    const XStreamRef stream = openFloats(path);
    std::int64_t frame = 0;
    for (std::uint32_t done = 1; stream != nullptr && done > 0; frame += done)
        if (XStreamReadFramesSync(stream, frame, kBlock, &done, block.data(), nullptr) != 0)
            break;
    if (stream != nullptr)
        XStreamClose(stream);
    return frame;
}

void BM_DecodeHour(benchmark::State& state)
{
    const std::string path = Hours::shared().path(static_cast<int>(state.range(0)));
    const std::string command = "ffmpeg -nostdin -v quiet -threads 1 -i '" + path + "' -f null -";
    double ours = 0, theirs = 0;
    decode(path); // modules are loaded before measuring
    for (auto _ : state) {
        theirs += seconds([&] {
            if (std::system(command.c_str()) != 0)
                state.SkipWithError("ffmpeg failed");
        });
        const double time = seconds([&] {
            if (decode(path) < 44100 * 3590LL)
                state.SkipWithError("not an hour");
        });
        state.SetIterationTime(time);
        ours += time;
    }
    state.counters["ratio"] = ours / theirs;
    state.counters["ffmpeg_s"] = theirs / static_cast<double>(state.iterations());
    state.SetLabel(state.range(0) == 0 ? "VBR MP3" : "AAC in M4A");
}
BENCHMARK(BM_DecodeHour)
    ->ArgName("kind")
    ->DenseRange(0, 1)
    ->UseManualTime()
    ->Iterations(3)
    ->Unit(benchmark::kMillisecond);

void BM_SeekInHour(benchmark::State& state)
{
    const XStreamRef stream = openFloats(Hours::shared().path(static_cast<int>(state.range(0))));
    std::vector<float> block(512 * 2);
    std::mt19937 random(3);
    std::uint32_t done = 0;
    if (XStreamReadFramesSync(stream, 44100 * 3000, 512, &done, block.data(), nullptr) != 0 || done != 512)
        state.SkipWithError("no first seek");
    double worst = 0;
    for (auto _ : state) {
        const double time = seconds([&] {
            if (XStreamReadFramesSync(stream, static_cast<std::int64_t>(random() % (44100 * 3590)), 512, &done,
                                      block.data(), nullptr) != 0)
                state.SkipWithError("no seek");
        });
        state.SetIterationTime(time);
        worst = std::max(worst, time);
    }
    state.counters["worst_ms"] = 1000 * worst;
    state.SetLabel(state.range(0) == 0 ? "VBR MP3" : "AAC in M4A");
    XStreamClose(stream);
}
BENCHMARK(BM_SeekInHour)
    ->ArgName("kind")
    ->DenseRange(0, 1)
    ->UseManualTime()
    ->Iterations(500)
    ->Unit(benchmark::kMillisecond);

/// Half an hour of stereo noise as 16-bit WAVE at 44.1 kHz, made once and removed at the end of the process.
class HalfHour {
public:
    static const HalfHour& shared()
    {
        static const HalfHour file;
        return file;
    }
    /// Runs the command, with the folder in place of "%".
    int run(std::string command) const
    {
        for (std::size_t at; (at = command.find('%')) != std::string::npos;)
            command.replace(at, 1, folder_.string());
        return std::system((command + " >/dev/null 2>&1 </dev/null").c_str());
    }

private:
    HalfHour()
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        folder_ = mkdtemp(pattern.data());
        if (run("sox -n -r 44100 -c 2 -b 16 %/half.wav synth 1800 pinknoise vol 0.5") != 0)
            std::abort();
    }
    ~HalfHour() { std::filesystem::remove_all(folder_); }

    std::filesystem::path folder_;
};

/// Half an hour to 24-bit AIFF, and to 48 kHz, by the command beside sox and ffmpeg, in turns. Ours is committed to
/// storage at the end, theirs is not. What each wrote goes before the next begins: a virtual machine pays for memory
/// that it has not used for a while, and not each program's output would take what another's left.
void BM_DecodeHalfHour(benchmark::State& state)
{
    const bool toAIFF = state.range(0) == 0;
    const std::string commands[] = {std::string(KTFILES_COMMAND) +
                                        (toAIFF ? " decode -q --force %/half.wav --bits 24 -o %/ours.aiff"
                                                : " decode -q --force %/half.wav --rate 48000 -o %/ours.wav"),
                                    toAIFF ? "sox %/half.wav -b 24 %/sox.aiff" : "sox %/half.wav -r 48000 %/sox.wav",
                                    toAIFF ? "ffmpeg -nostdin -y -i %/half.wav -c:a pcm_s24be %/ffmpeg.aiff"
                                           : "ffmpeg -nostdin -y -i %/half.wav -ar 48000 %/ffmpeg.wav"};
    const std::string removals[] = {toAIFF ? "rm %/ours.aiff" : "rm %/ours.wav",
                                    toAIFF ? "rm %/sox.aiff" : "rm %/sox.wav",
                                    toAIFF ? "rm %/ffmpeg.aiff" : "rm %/ffmpeg.wav"};
    std::vector<double> wall[3], processor[3];
    for (auto _ : state)
        for (std::size_t i = 0; i < 3; ++i) {
            const double before = processorSecondsOfChildren();
            wall[i].push_back(seconds([&] {
                if (HalfHour::shared().run(commands[i]) != 0)
                    state.SkipWithError("a command failed");
            }));
            processor[i].push_back(processorSecondsOfChildren() - before);
            if (HalfHour::shared().run(removals[i]) != 0)
                state.SkipWithError("an output is not there");
            if (i == 0)
                state.SetIterationTime(wall[i].back());
        }
    state.counters["cpu_s"] = median(processor[0]);
    state.counters["cpu_of_sox"] = median(processor[0]) / median(processor[1]);    // to AIFF at most 0.6
    state.counters["cpu_of_ffmpeg"] = median(processor[0]) / median(processor[2]); // to 48 kHz at most 1.2
    state.counters["wall_of_sox"] = median(wall[0]) / median(wall[1]);
    state.counters["wall_of_ffmpeg"] = median(wall[0]) / median(wall[2]);
    state.SetLabel(toAIFF ? "to 24-bit AIFF" : "to 48 kHz");
}
BENCHMARK(BM_DecodeHalfHour)
    ->ArgName("kind")
    ->DenseRange(0, 1)
    ->UseManualTime()
    ->Iterations(5)
    ->Unit(benchmark::kMillisecond);

void run(const char* program)
{
    const std::string media = std::string(KTFILES_MEDIA) + "/tone-16.wav";
    char* const arguments[] = {const_cast<char*>(program), const_cast<char*>(media.c_str()), nullptr};
    pid_t process = 0;
    int status = 1;
    if (posix_spawn(&process, program, nullptr, nullptr, arguments, environ) != 0 ||
        waitpid(process, &status, 0) != process || status != 0)
        std::abort();
}

/// Two processes in turns: one reads linear PCM through the library, the other reads the bytes and only links libxml2.
void BM_StartUp(benchmark::State& state)
{
    std::vector<double> differences;
    for (auto _ : state) {
        const double bare = seconds([] { run(KTFILES_START_BARE); });
        const double time = seconds([] { run(KTFILES_START_LIBRARY); });
        state.SetIterationTime(time);
        differences.push_back(time - bare);
    }
    const auto middle = differences.begin() + static_cast<std::ptrdiff_t>(differences.size() / 2);
    std::nth_element(differences.begin(), middle, differences.end());
    state.counters["more_ms_median"] = 1000 * *middle;
}
BENCHMARK(BM_StartUp)->UseManualTime()->Iterations(300)->Unit(benchmark::kMillisecond);

} // namespace
