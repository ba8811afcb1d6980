#include "tool/shared/library/LibraryRecordCheck.h"

#include "platform/core/UTF8.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <ctime>
#include <span>

namespace {

constexpr std::size_t kLongestFolderPath = 65'536; // paths of open folders are not bounded by PATH_MAX
constexpr std::size_t kLongestFileName = 1'024;
constexpr std::size_t kMostKeptPoints = 1 << 17; // 30 seconds at a million frames per second, 256 frames per point
constexpr std::int64_t kFewestFramesPerPoint = 256;
constexpr std::int64_t kMostFramesPerPoint = std::int64_t{1} << 40;
constexpr std::size_t kMostKeptProblems = 10'000;
constexpr std::int64_t kSecondsOfDay = 86'400; // clocks of machines differ

bool isWellFormed(std::string_view text)
{
    constexpr std::string_view replacement = "\xef\xbf\xbd";
    while (!text.empty()) {
        std::string_view rest = text;
        if (platform::takeCharacter(rest) == 0xfffd && text.substr(0, text.size() - rest.size()) != replacement)
            return false;
        text = rest;
    }
    return true;
}

// Of words that mean something to queries; empty for what is not known.
bool isOneOf(const std::string& word, std::span<const std::string_view> words)
{
    return word.empty() || std::ranges::find(words, word) != words.end();
}

void requireThat(bool isGood, const char* what)
{
    if (!isGood)
        throw Failure(fmt::format("{} cannot be what it says", what));
}

template <class Number>
void requireRange(const std::optional<Number>& number, const char* key, Number least, Number most)
{
    if (number)
        requireThat(*number >= least && *number <= most, key);
}

void requireNumbers(const LibraryRecord& record)
{
    constexpr std::int64_t most = std::int64_t{1} << 60;
    constexpr double mostReal = 1e15;
    requireThat(record.stamp.size >= 0, "size");
    requireThat(record.indexed >= 0 && record.indexed <= std::time(nullptr) + kSecondsOfDay, "indexed");
    requireRange<double>(record.sampleRate, "sampleRate", 0, mostReal);
    requireRange<std::int64_t>(record.bitsPerSample, "bitsPerSample", 0, 1024);
    requireRange<std::int64_t>(record.sourceBits, "sourceBits", 1, 1024);
    requireRange<std::int64_t>(record.floatingPoint, "floatingPoint", 0, 1);
    requireRange<std::int64_t>(record.channels, "channels", 0, UINT32_MAX);
    requireRange<std::int64_t>(record.frames, "frames", 0, most);
    requireRange<double>(record.durationSeconds, "durationSeconds", 0, mostReal);
    requireRange<std::int64_t>(record.bitRate, "bitRate", 0, most);
    requireRange<double>(record.tempo, "tempo", 0, mostReal);
    requireRange<std::int64_t>(record.beatCount, "beatCount", INT32_MIN, UINT32_MAX);
    requireRange<std::int64_t>(record.keyNote, "keyNote", 0, 11);
}

void requireTexts(const LibraryRecord& record)
{
    static constexpr std::array<std::string_view, 3> states = {"whole", "damaged", "unreadable"};
    static constexpr std::array<std::string_view, 3> kinds = {"loop", "one-shot", "recording"};
    static constexpr std::array<std::string_view, 4> modes = {"major", "minor", "neither", "both"};
    requireThat(!record.state.empty() && isOneOf(record.state, states), "state");
    requireThat(isOneOf(record.kind, kinds), "kind");
    requireThat(isOneOf(record.mode, modes), "mode");
    for (const LibraryColumn& column : libraryColumns())
        if (const auto* const text = std::get_if<LibraryRecord::Text LibraryRecord::*>(&column.member))
            requireThat(isWellFormed(record.**text), column.key);
    requireThat(record.problems.size() <= kMostKeptProblems, "problems");
    for (const LibraryProblem& problem : record.problems)
        requireThat(!problem.kind.empty() && isWellFormed(problem.kind) && isWellFormed(problem.text), "problems");
    requireThat(isWellFormed(record.fields), "fields");
    requireThat(isWellFormed(record.tags), "tags");
}

void requireOverview(const LibraryRecord& record)
{
    if (!record.overview)
        return;
    const std::int64_t each = record.overview->framesPerPoint;
    const std::size_t count = record.overview->points.size() / 2;
    requireThat(each >= kFewestFramesPerPoint && each <= kMostFramesPerPoint && (each & (each - 1)) == 0,
                "overview.framesPerPoint");
    requireThat(record.overview->points.size() % 2 == 0 && count <= kMostKeptPoints, "overview.points");
    if (record.frames)
        requireThat(static_cast<std::int64_t>(count) <= *record.frames / each + 1, "overview.points");
}

} // namespace

void requireFileName(const std::string& name)
{
    if (name.empty() || name == "." || name == ".." || name.size() > kLongestFileName ||
        name.find_first_of(std::string_view("/\0", 2)) != name.npos)
        throw Failure("the path is not absolute and plain");
}

void requireFolderPath(const std::string& path)
{
    if (path.empty() || path.front() != '/' || path.back() != '/' || path.size() > kLongestFolderPath)
        throw Failure("the path is not absolute and plain");
    for (std::size_t start = 1; start < path.size();) {
        const std::size_t end = path.find('/', start);
        requireFileName(path.substr(start, end - start));
        start = end + 1;
    }
}

void requireSound(const LibraryRecord& record)
{
    requireFolderPath(record.place.folder);
    requireFileName(record.place.name);
    requireNumbers(record);
    requireTexts(record);
    requireOverview(record);
}
