// ADM documents: parsing, compared with bare libxml2 that gets the same bytes and calls empty functions; looking IDs
// up; and the command.
#include "ADMDocuments.h"
#include "Timing.h"
#include "adm/ADMDocument.h"

#include <benchmark/benchmark.h>

#include <libxml/parser.h>
#include <sys/resource.h>
#include <sys/wait.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <numeric>
#include <random>
#include <string>
#include <vector>

namespace {

constexpr std::size_t kPiece = 64 * 1024;
constexpr ADMDocumentShape kLarge{128, 4000}; // some 200 MB
constexpr ADMDocumentShape kSmall{8, 300};    // some 1 MB

class FileStream : public platform::InputStream {
public:
    explicit FileStream(const std::string& path) : file_(std::fopen(path.c_str(), "rb")) {}
    ~FileStream() override { std::fclose(file_); }
    std::ptrdiff_t read(std::span<std::byte> buffer) override
    {
        return static_cast<std::ptrdiff_t>(std::fread(buffer.data(), 1, buffer.size(), file_));
    }

private:
    std::FILE* file_;
};

/// A document in a temporary file that is removed at the end of the process.
class DocumentFile {
public:
    explicit DocumentFile(ADMDocumentShape shape)
    {
        path_ = std::filesystem::temp_directory_path() / "ktfiles-bench-XXXXXX";
        const int descriptor = mkstemp(path_.data());
        std::FILE* file = descriptor < 0 ? nullptr : fdopen(descriptor, "wb");
        if (file == nullptr)
            std::abort();
        ADMDocumentStream document(shape);
        std::array<std::byte, kPiece> piece;
        for (std::ptrdiff_t count; (count = document.read(piece)) > 0; size_ += static_cast<std::size_t>(count))
            if (std::fwrite(piece.data(), 1, static_cast<std::size_t>(count), file) != static_cast<std::size_t>(count))
                std::abort();
        std::fclose(file);
    }
    ~DocumentFile() { std::filesystem::remove(path_); }
    DocumentFile(const DocumentFile&) = delete;
    DocumentFile& operator=(const DocumentFile&) = delete;

    const std::string& path() const { return path_; }
    std::size_t size() const { return size_; }

private:
    std::string path_;
    std::size_t size_ = 0;
};

double cpuSeconds()
{
    timespec now{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

bool parseBare(const std::string& path)
{
    xmlSAXHandler sax{};
    sax.initialized = XML_SAX2_MAGIC;
    sax.startElementNs = [](void*, const xmlChar*, const xmlChar*, const xmlChar*, int, const xmlChar**, int, int,
                            const xmlChar**) {};
    sax.endElementNs = [](void*, const xmlChar*, const xmlChar*, const xmlChar*) {};
    sax.characters = sax.ignorableWhitespace = sax.cdataBlock = [](void*, const xmlChar*, int) {};
    FileStream stream(path);
    xmlParserCtxtPtr context = xmlCreatePushParserCtxt(&sax, nullptr, nullptr, 0, nullptr);
    xmlCtxtUseOptions(context, XML_PARSE_NONET);
    std::array<std::byte, kPiece> piece;
    for (std::ptrdiff_t count; (count = stream.read(piece)) > 0;)
        xmlParseChunk(context, reinterpret_cast<const char*>(piece.data()), static_cast<int>(count), 0);
    xmlParseChunk(context, nullptr, 0, 1);
    const bool isWellFormed = context->wellFormed != 0;
    if (context->myDoc != nullptr)
        xmlFreeDoc(context->myDoc);
    xmlFreeParserCtxt(context);
    return isWellFormed;
}

/// A value of /proc/self/status in MiB.
double statusMiB(const std::string& key)
{
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);)
        if (line.starts_with(key))
            return std::strtod(line.c_str() + key.size(), nullptr) / 1024;
    return 0;
}

/// Starts a new measurement of the peak.
void resetPeak()
{
    std::ofstream("/proc/self/clear_refs") << 5;
}

/// Both alternate, so that page cache and processor treat them alike, and the best turn of each counts, because others
/// use the machine. The benchmark's time is ours, including the destruction of the document.
void parseDocuments(benchmark::State& state, ADMDocumentShape shape, int times)
{
    const DocumentFile file(shape);
    double bare = 1e9, ours = 1e9, peak = 0;
    for (auto _ : state) {
        double start = cpuSeconds();
        for (int i = 0; i < times; ++i)
            if (!parseBare(file.path()))
                state.SkipWithError("the document is not well-formed");
        bare = std::min(bare, cpuSeconds() - start);

        resetPeak();
        start = cpuSeconds();
        for (int i = 0; i < times; ++i) {
            ADMDocument document(std::make_unique<FileStream>(file.path()));
            if (!document.parse() || document.audioObjects().size() != static_cast<std::size_t>(shape.objects))
                state.SkipWithError("the document is not read");
        }
        const double seconds = cpuSeconds() - start;
        peak = std::max(peak, statusMiB("VmHWM:"));
        ours = std::min(ours, seconds);
        state.SetIterationTime(seconds / times);
    }
    const double megabytes = static_cast<double>(file.size()) * 1e-6 * times;
    state.counters["bare_MB_per_s"] = megabytes / bare;
    state.counters["MB_per_s"] = megabytes / ours;
    state.counters["times_bare"] = bare / ours; // at least 0.7, for 1 MB at least 0.55
    state.counters["peak_MiB"] = peak;          // at most 150
    state.counters["file_MB"] = static_cast<double>(file.size()) * 1e-6;
}

void ParseLargeADM(benchmark::State& state)
{
    parseDocuments(state, kLarge, 1);
}
BENCHMARK(ParseLargeADM)->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(10);

void ParseSmallADM(benchmark::State& state)
{
    parseDocuments(state, kSmall, 50);
}
BENCHMARK(ParseSmallADM)->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(10);

/// Nanoseconds for a read at a place that the previous read returned, in as much memory as a table of a million
/// elements takes: the minimum for an isolated lookup.
double dependentRead(std::size_t reads)
{
    constexpr std::size_t slot = 32 / sizeof(std::uint32_t), slots = std::size_t{1} << 21;
    std::vector<std::uint32_t> places(slots), memory(slots * slot);
    std::iota(places.begin(), places.end(), 0U);
    std::shuffle(places.begin(), places.end(), std::mt19937(2));
    for (std::size_t i = 0; i < slots; ++i) // one cycle through all slots
        memory[places[i] * slot] = places[(i + 1) % slots];
    std::uint32_t at = 0;
    const double start = cpuSeconds();
    for (std::size_t i = 0; i < reads; ++i)
        at = memory[at * slot];
    const double seconds = cpuSeconds() - start;
    benchmark::DoNotOptimize(at);
    return 1e9 * seconds / static_cast<double>(reads);
}

/// A million track UIDs looked up in random order; and the same as references of one object, which the document
/// resolves. Medians of turns.
void FindADMElement(benchmark::State& state)
{
    constexpr std::size_t count = 1000000;
    ADMDocument document(nullptr);
    std::vector<std::string> ids(count);
    std::vector<double> found, resolved, read;
    for (std::size_t i = 0; i < count; ++i) {
        std::array<char, 32> id{};
        std::snprintf(id.data(), id.size(), "ATU_%08zX", i + 1);
        ids[i] = id.data();
        document.addAudioTrackUID(ADMAudioTrackUID::audioTrackUIDWithAttributes({{"UID", ids[i]}}));
    }
    std::shuffle(ids.begin(), ids.end(), std::mt19937(1));
    auto made = ADMAudioObject::audioObjectWithAttributes({{"audioObjectID", "AO_1001"}, {"audioObjectName", "All"}});
    ADMAudioObject& object = *made;
    object.setAudioTrackUIDRefs(ids);
    document.addAudioObject(std::move(made));
    for (auto _ : state) {
        double start = cpuSeconds();
        for (const std::string& id : ids)
            if (document.findADMElementRef(id) == nullptr)
                state.SkipWithError("an ID is not found");
        found.push_back(1e9 * (cpuSeconds() - start) / count);
        object.setAudioTrackUIDs({});
        start = cpuSeconds();
        object.resolveIDRefsWithResolver(document);
        resolved.push_back(1e9 * (cpuSeconds() - start) / count);
        if (object.audioTrackUIDs().size() != count)
            state.SkipWithError("the references are not resolved");
        read.push_back(dependentRead(count));
        state.SetIterationTime(found.back() * 1e-9);
    }
    const double one = median(read);
    state.counters["dependent_read_ns"] = one;
    state.counters["find_ns"] = median(found);
    state.counters["resolve_ns"] = median(resolved);
    state.counters["times_read"] = median(found) / one;            // at most 1.2
    state.counters["resolve_times_read"] = median(resolved) / one; // at most 0.5
}
BENCHMARK(FindADMElement)->UseManualTime()->Unit(benchmark::kNanosecond)->Iterations(10);

/// Processor time of the processes that were waited for.
double childrenSeconds()
{
    rusage usage{};
    getrusage(RUSAGE_CHILDREN, &usage);
    const auto seconds = [](const timeval& time) {
        return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) * 1e-6;
    };
    return seconds(usage.ru_utime) + seconds(usage.ru_stime);
}

/// `ktfiles adm --json` as a process, compared with the library's parse of the same file.
void ADMCommandJson(benchmark::State& state)
{
    const DocumentFile file(kLarge);
    const std::string command = "'" KTFILES_COMMAND "' adm --json '" + file.path() + "' > /dev/null";
    double parse = 1e9, json = 1e9;
    for (auto _ : state) {
        double start = cpuSeconds();
        {
            ADMDocument document(std::make_unique<FileStream>(file.path()));
            if (!document.parse())
                state.SkipWithError("the document is not read");
        }
        parse = std::min(parse, cpuSeconds() - start);

        start = childrenSeconds();
        const int result = std::system(command.c_str());
        if (!WIFEXITED(result) || WEXITSTATUS(result) != 0)
            state.SkipWithError("ktfiles adm failed");
        const double seconds = childrenSeconds() - start;
        json = std::min(json, seconds);
        state.SetIterationTime(seconds);
    }
    state.counters["parse_s"] = parse;
    state.counters["json_s"] = json;
    state.counters["times_parse"] = json / parse; // at most 2
}
BENCHMARK(ADMCommandJson)->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(8);

} // namespace
