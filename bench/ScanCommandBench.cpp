// `ktfiles scan` on 20,000 loops as a process, compared with the library alone on the same files: one thread per core,
// each with a share of the paths, which are known in advance, every loop chunk of every file read, nothing printed.
#include "LoopFiles.h"
#include "loops/VireoLoopChunksManager.h"

#include <benchmark/benchmark.h>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <thread>

namespace {

constexpr int kFiles = 20000;
constexpr int kFilesInAFolder = 500;

struct Library {
    Library()
    {
        Bytes loop = aiffLoop();
        for (int i = 0; i < kFiles; ++i) {
            const std::string pack = "pack" + std::to_string(i / kFilesInAFolder);
            if (i % kFilesInAFolder == 0)
                std::filesystem::create_directory(folder.path() / pack);
            paths.push_back(folder.write(pack + "/loop" + std::to_string(i) + ".aif", loop));
        }
    }
    BenchFolder folder;
    std::vector<std::string> paths;
};

double cpuSecondsOf(int who)
{
    rusage usage{};
    getrusage(who, &usage);
    const auto seconds = [](const timeval& time) {
        return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) * 1e-6;
    };
    return seconds(usage.ru_utime) + seconds(usage.ru_stime);
}

double wallSeconds()
{
    return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

double scanWithTheCommand(benchmark::State& state, const std::string& folder)
{
    const std::string command = "'" KTFILES_COMMAND "' scan '" + folder + "' > /dev/null";
    const double start = wallSeconds();
    const int result = std::system(command.c_str());
    if (!WIFEXITED(result) || WEXITSTATUS(result) != 0)
        state.SkipWithError("ktfiles scan failed");
    return wallSeconds() - start;
}

double scanWithTheLibrary(benchmark::State& state, const std::vector<std::string>& paths)
{
    std::atomic<std::size_t> loops = 0;
    const std::size_t threads = std::max(std::thread::hardware_concurrency(), 1U);
    const double start = wallSeconds();
    {
        std::vector<std::jthread> workers;
        for (std::size_t first = 0; first < threads; ++first)
            workers.emplace_back([&, first] {
                for (std::size_t i = first; i < paths.size(); i += threads)
                    loops += readLoopTags(paths[i]);
            });
    }
    const double seconds = wallSeconds() - start;
    if (loops != paths.size())
        state.SkipWithError("the tags were not read");
    return seconds;
}

void ScanCommand(benchmark::State& state)
{
    const Library library;
    double command = 0, bare = 0, bareCPU = 0;
    scanWithTheLibrary(state, library.paths);
    for (auto _ : state) {
        bareCPU -= cpuSecondsOf(RUSAGE_SELF);
        bare += scanWithTheLibrary(state, library.paths);
        bareCPU += cpuSecondsOf(RUSAGE_SELF);
        const double seconds = scanWithTheCommand(state, library.folder.path());
        command += seconds;
        state.SetIterationTime(seconds);
    }
    const double commandCPU = cpuSecondsOf(RUSAGE_CHILDREN);
    const double perFile = 1e6 / kFiles / static_cast<double>(state.iterations());
    state.counters["us_per_file"] = command * perFile;
    state.counters["library_us_per_file"] = bare * perFile;
    state.counters["cpu_times_library"] = commandCPU / bareCPU;
    state.counters["times_library"] = command / bare; // at most 1.15
}
BENCHMARK(ScanCommand)->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(8);

} // namespace
