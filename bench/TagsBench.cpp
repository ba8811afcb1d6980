// The tags of a folder of AIFF loops: reads every chunk that the manager knows from every file. Compared with the
// minimum (open, one read of 16 KiB, close), and with reading only the title with TagLib.
#include "LoopFiles.h"
#include "loops/VireoLoopChunksManager.h"
#include "platform/core/Packed.h"

#include <benchmark/benchmark.h>
#include <taglib/aifffile.h>
#include <taglib/tag.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <fstream>

namespace {

constexpr int kFiles = 2000;

const std::vector<std::string>& loopPaths()
{
    static const BenchFolder folder;
    static const std::vector<std::string> paths = [] {
        std::vector<std::string> made;
        for (int i = 0; i < kFiles; ++i)
            made.push_back(folder.write("loop" + std::to_string(i) + ".aif", aiffLoop()));
        return made;
    }();
    return paths;
}

bool readTitleWithTagLib(const std::string& path)
{
    TagLib::RIFF::AIFF::File file(path.c_str(), false);
    return file.isValid() && file.tag() != nullptr && file.tag()->title() == TagLib::String(std::string(kLoopTitle));
}

/// Moves what follows the samples back, to make room for `size` bytes of samples.
void enlargeSamples(const std::string& path, const Bytes& loop, std::int64_t size)
{
    const BytesView idOfSamples = bytesOf("SSND");
    const auto found = std::search(loop.begin(), loop.end(), idOfSamples.begin(), idOfSamples.end()) - loop.begin();
    const auto samples = static_cast<std::size_t>(found);
    const std::size_t behind = samples + 8 + loadBE<std::uint32_t>(loop.data() + samples + 4);
    const auto grown =
        static_cast<std::uint32_t>(static_cast<std::size_t>(size) + loop.size() - (behind - samples - 8));
    std::array<std::byte, 4> sizes[2];
    storeBE(sizes[0].data(), grown - 8);
    storeBE(sizes[1].data(), static_cast<std::uint32_t>(size));
    std::fstream file(path, std::ios::binary | std::ios::in | std::ios::out);
    const auto put = [&](std::size_t at, BytesView bytes) {
        file.seekp(static_cast<std::streamoff>(at));
        file.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    };
    put(4, sizes[0]);
    put(samples + 4, sizes[1]);
    put(samples + 8 + static_cast<std::size_t>(size), BytesView(loop).subspan(behind));
    if (!file.flush())
        std::abort();
}

template <class Road>
double pass(benchmark::State& state, const char* problem, Road road)
{
    const double start = cpuSeconds();
    for (const std::string& path : loopPaths())
        if (!road(path))
            state.SkipWithError(problem);
    return cpuSeconds() - start;
}

void ReadTags(benchmark::State& state)
{
    double bare = 0, ours = 0, taglib = 0;
    pass(state, "open, read, close failed", openReadClose);
    for (auto _ : state) {
        bare += pass(state, "open, read, close failed", openReadClose);
        taglib += pass(state, "TagLib failed", readTitleWithTagLib);
        const double seconds = pass(state, "the tags were not read", readLoopTags);
        ours += seconds;
        state.SetIterationTime(seconds);
    }
    const double perFile = 1e6 / kFiles / static_cast<double>(state.iterations());
    state.counters["bare_us_per_file"] = bare * perFile;
    state.counters["us_per_file"] = ours * perFile;
    state.counters["taglib_us_per_file"] = taglib * perFile;
    state.counters["times_bare"] = ours / bare;                // at most 2
    state.counters["times_as_fast_as_taglib"] = taglib / ours; // at least 2
}
BENCHMARK(ReadTags)->UseManualTime()->Unit(benchmark::kMillisecond)->MinTime(2);

/// Opens an AIFF loop, changes one number of its tags in place, closes it. The tags follow as many bytes of samples as
/// the argument says, mostly a hole: the time must not depend on it.
void SetTag(benchmark::State& state)
{
    const BenchFolder folder;
    const Bytes loop = aiffLoop();
    const std::string path = folder.write("loop.aif", loop);
    enlargeSamples(path, loop, state.range(0));
    const auto url =
        platform::URL::createWithFileSystemPath(platform::String::fromUTF8(path), platform::PathStyle::posix, false);
    std::int64_t beats = 0;
    for (auto _ : state) {
        VireoLoopChunkList chunks;
        chunks.push_back(std::make_unique<VireoLoopCombinedTaggingChunk>());
        auto& tags = static_cast<VireoLoopCombinedTaggingChunk&>(*chunks.front()).tags();
        VireoLoopChunksManager manager(url);
        manager.readChunks(chunks);
        platform::Dictionary changed = tags.dataDictionary();
        changed[VireoLoopCombinedTagsChunkDataBeatCountKey] = ++beats;
        tags.setDataDictionary(std::move(changed));
        if (!manager.writeChunks(chunks))
            state.SkipWithError("the tag was not written");
    }
}
BENCHMARK(SetTag)->Arg(1 << 16)->Arg(1 << 30)->Unit(benchmark::kMicrosecond)->MinTime(1);

} // namespace
