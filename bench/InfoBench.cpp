// Describing files, compared with other programs: `ktfiles info --json` over 400 mixed files as a process against
// exiftool and mediainfo; and describing one compressed file against FFmpeg opening it and finding its streams.
#include "LoopFiles.h"
#include "Timing.h"
#include "audiofile/AudioFileInfo.h"
#include "files/CFileIO.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <span>
#include <string>
#include <vector>

extern "C" {
#include <libavformat/avformat.h>
}

namespace {

namespace fs = std::filesystem;

double milliseconds(const auto& work)
{
    const auto begin = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - begin).count();
}

bool run(const fs::path& folder, const std::string& command)
{
    const std::string line = "cd '" + folder.string() + "' && " + command + " >/dev/null 2>&1 </dev/null";
    return std::system(line.c_str()) == 0;
}

/// A sound of that length in each format, made by ffmpeg unless another encoder is named; removed with the object.
class Sounds {
public:
    explicit Sounds(int seconds)
    {
        const std::string sound =
            "aevalsrc='0.3*sin(440*2*PI*t)*(0.6+0.4*sin(t))+0.2*(random(0)-0.5)*gt(mod(t\\,3)\\,2)|"
            "0.3*sin(550*2*PI*t)':s=44100:d=" +
            std::to_string(seconds);
        if (!run(folder_.path(), "ffmpeg -f lavfi -i \"" + sound + "\" sound.wav"))
            std::abort();
    }
    /// Made by another encoder if one is named.
    fs::path made(const std::string& name, const std::string& options, const std::string& encoder = "") const
    {
        const std::string command = encoder.empty() ? "ffmpeg -i sound.wav " + options + " -strict -2 " + name
                                                    : encoder + " sound.wav -o " + name;
        if (!run(folder_.path(), command))
            std::abort();
        return fs::path(folder_.path()) / name;
    }
    fs::path folder() const { return folder_.path(); }

private:
    BenchFolder folder_;
};

struct Format {
    const char* extension;
    const char* options;
    const char* encoder = ""; // of "sound.wav -o NAME"
};

constexpr Format kFormats[] = {
    {"ogg", "-c:a libvorbis"},
    {"opus", ""},
    {"oga", "-c:a flac"},
    {"wv", "", "wavpack"},
    {"wv", ""}, // blocks without checksums
    {"tta", ""},
    {"wma", ""},
    {"mka", "-c:a libvorbis"},
    {"ac3", ""},
    {"mp2", ""},
    {"aac", "-ar 22050"},
    {"dts", "-ar 48000 -c:a dca"},
    {"thd", ""},
};

void describeWithFFmpeg(const char* path)
{
    AVFormatContext* context = nullptr;
    if (avformat_open_input(&context, path, nullptr, nullptr) >= 0)
        avformat_find_stream_info(context, nullptr);
    avformat_close_input(&context);
}

void DescribeCompressed(benchmark::State& state)
{
    const Format& format = kFormats[state.range(0)];
    const Sounds sounds(60);
    const std::string path = sounds.made(std::string("sound.") + format.extension, format.options, format.encoder);
    state.SetLabel(std::string(format.extension) + " " + format.encoder);
    av_log_set_level(AV_LOG_QUIET);
    const auto describe = [&] {
        CFileIO file;
        AudioFileInfo info;
        if (file.OpenRead(CFileRef(path.c_str(), false), 0) != 0 || GetAudioFileInfo(file, 0, info) != 0)
            state.SkipWithError("not described");
    };
    describe(); // loads the module
    std::vector<double> ours, theirs;
    for (auto _ : state) {
        theirs.push_back(milliseconds([&] { describeWithFFmpeg(path.c_str()); }));
        ours.push_back(milliseconds(describe));
        state.SetIterationTime(ours.back() / 1000);
    }
    state.counters["ms"] = median(ours);
    state.counters["ffmpeg_ms"] = median(theirs);
    state.counters["times_ffmpeg"] = median(ours) / median(theirs); // at most 1.3
}
BENCHMARK(DescribeCompressed)
    ->DenseRange(0, std::size(kFormats) - 1)
    ->UseManualTime()
    ->Iterations(15)
    ->Unit(benchmark::kMillisecond);

void InfoCommand(benchmark::State& state)
{
    constexpr int kFiles = 400;
    const Sounds sounds(2);
    const Format all[] = {{"wav", ""},          {"wav", "-c:a pcm_s24le"},
                          {"aiff", ""},         {"caf", ""},
                          {"caf", "-c:a alac"}, {"flac", ""},
                          {"mp3", ""},          {"m4a", ""},
                          {"w64", ""},          {"wav", "-c:a adpcm_ms"},
                          {"au", ""},           {"mp3", "-ac 1"},
                          {"aac", ""},          {"ogg", ""},
                          {"opus", ""},         {"wv", "", "wavpack"}, // described by their ends
                          {"wma", ""}};                                // described by the decoder module
    const auto mixed = std::span(all).first(static_cast<std::size_t>(state.range(0)));
    for (int i = 0; i < kFiles; ++i) {
        const std::size_t kind = static_cast<std::size_t>(i) % std::size(mixed);
        const std::string name = std::to_string(i) + "." + mixed[kind].extension;
        if (static_cast<std::size_t>(i) < std::size(mixed))
            sounds.made(name, mixed[kind].options, mixed[kind].encoder);
        else
            fs::copy_file(sounds.folder() / (std::to_string(kind) + "." + mixed[kind].extension),
                          sounds.folder() / name);
    }
    fs::remove(sounds.folder() / "sound.wav");
    const auto timed = [&](const char* command) {
        return milliseconds([&] {
            if (!run(sounds.folder(), command))
                state.SkipWithError(command);
        });
    };
    std::vector<double> ours, exiftool, mediainfo;
    for (auto _ : state) {
        ours.push_back(timed("'" KTFILES_COMMAND "' info --json *"));
        exiftool.push_back(timed("(exiftool -j *; true)"));
        mediainfo.push_back(timed("mediainfo --Output=JSON *"));
        state.SetIterationTime(ours.back() / 1000);
    }
    state.counters["ms"] = median(ours);
    state.counters["exiftool_times"] = median(exiftool) / median(ours);   // at least 10
    state.counters["mediainfo_times"] = median(mediainfo) / median(ours); // at least 10
}
BENCHMARK(InfoCommand)
    ->ArgName("kinds")
    ->Arg(13)
    ->Arg(16)
    ->Arg(17)
    ->UseManualTime()
    ->Iterations(5)
    ->Unit(benchmark::kMillisecond);

} // namespace
