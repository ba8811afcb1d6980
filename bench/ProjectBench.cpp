// The files used by a project with many alternatives, and the property lists that name them.
#include "Timing.h"
#include "platform/PropertyList.h"
#include "project/ProjectInformation.h"

#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

namespace {

using namespace platform;

constexpr int kAlternatives = 50;
constexpr int kPaths = 20000; // per alternative
constexpr std::size_t kListSize = 10 << 20;

/// Paths as a project stores them; `shared` of 20 are the same in every alternative.
Dictionary metaDataOf(int alternative, int shared)
{
    Dictionary metaData{{"SampleRate", 48000}, {"BeatsPerMinute", 120.5}, {"NumberOfTracks", 64}, {"SongKey", "C"}};
    for (std::size_t kind = 0; kind < kProjectMediaLists.size(); ++kind) {
        Array paths;
        for (int i = 0; i < kPaths / static_cast<int>(kProjectMediaLists.size()); ++i) {
            const int take = i % 20 < shared ? 0 : alternative + 1;
            paths.emplace_back("/Users/somebody/Music/Song.fuguex/Media/Audio Files/Vocals take " +
                               std::to_string(take) + '#' + std::to_string(kind) + '-' + std::to_string(i) + ".wav");
        }
        metaData[kProjectMediaLists[kind].key] = std::move(paths);
    }
    return metaData;
}

/// A package of 50 alternatives in the system's temporary folder.
class LargeProject {
public:
    explicit LargeProject(int shared)
    {
        std::string pattern = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        if (mkdtemp(pattern.data()) == nullptr)
            std::abort();
        folder_ = pattern;
        Dictionary names;
        for (int i = 0; i < kAlternatives; ++i) {
            names[std::to_string(i)] = "Mix " + std::to_string(i);
            lists_.push_back(*writePropertyList(metaDataOf(i, shared), PropertyListFormat::binary));
            const auto file = ProjectInformation::metaDataURLForBundleURL(url(), i, CreateDirectories::yes);
            std::ofstream(file->posixPath(), std::ios::binary)
                .write(textOf(lists_.back()).data(), static_cast<std::streamsize>(lists_.back().size()));
        }
        if (!ProjectInformation::writeInfoDictionaryToProjectBundleURL({{"VariantNames", names}}, url()))
            std::abort();
    }
    ~LargeProject() { std::filesystem::remove_all(folder_); }
    LargeProject(const LargeProject&) = delete;
    LargeProject& operator=(const LargeProject&) = delete;

    URLRef url() const
    {
        return URL::createWithFileSystemPath(String::fromUTF8((folder_ / "Song.fuguex").string()), PathStyle::posix,
                                             true);
    }
    const std::vector<Bytes>& lists() const { return lists_; }

private:
    std::filesystem::path folder_;
    std::vector<Bytes> lists_;
};

/// Compared with parsing the 50 lists from memory in turn. 20 of 20: every alternative uses the same files.
void AllUsedFiles(benchmark::State& state)
{
    const LargeProject project(static_cast<int>(state.range(0)));
    double parsing = 0, ours = 0;
    std::size_t files = 0;
    for (auto _ : state) {
        parsing += seconds([&] {
            std::vector<Value> values;
            for (const Bytes& list : project.lists())
                values.push_back(*readPropertyList(list));
            benchmark::DoNotOptimize(values);
        });
        const double taken = seconds([&] {
            const auto information = ProjectInformation::initWithProjectURL(project.url());
            files = information->allUsedFilesByAnyVariant().size();
        });
        ours += taken;
        state.SetIterationTime(taken);
    }
    state.counters["files"] = static_cast<double>(files);
    state.counters["parsing_ms"] = 1e3 * parsing / static_cast<double>(state.iterations());
    state.counters["times_parsing"] = ours / parsing; // at most 3
}
BENCHMARK(AllUsedFiles)->ArgName("shared")->Arg(20)->Arg(18)->Arg(0)->UseManualTime()->Unit(benchmark::kMillisecond);

/// 10 MiB of dictionaries and texts.
Value largeList(PropertyListFormat format)
{
    Array items;
    for (int i = 0;; ++i) {
        items.emplace_back(Dictionary{{"Name", "Vocals take " + std::to_string(i)},
                                      {"Path", "Media/Audio Files/Vocals take #" + std::to_string(i) + ".wav"},
                                      {"Comment", "sung twice, the second time with the window closed"}});
        if (i % 4096 == 0 && writePropertyList(items, format)->size() >= kListSize)
            return items;
    }
}

void ReadList(benchmark::State& state, PropertyListFormat format)
{
    const Bytes bytes = *writePropertyList(largeList(format), format);
    for (auto _ : state) { // destroying the value is not parsing
        std::optional<Value> value;
        state.SetIterationTime(seconds([&] { value = readPropertyList(bytes); }));
        benchmark::DoNotOptimize(value);
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(bytes.size()) * state.iterations());
}

void WriteList(benchmark::State& state, PropertyListFormat format)
{
    const Value value = largeList(format);
    std::size_t size = 0;
    for (auto _ : state)
        size = writePropertyList(value, format)->size();
    state.SetBytesProcessed(static_cast<std::int64_t>(size) * state.iterations());
}

BENCHMARK_CAPTURE(ReadList, binary, PropertyListFormat::binary)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(WriteList, binary, PropertyListFormat::binary)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ReadList, XML, PropertyListFormat::xml)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(WriteList, XML, PropertyListFormat::xml)->Unit(benchmark::kMillisecond);

} // namespace
