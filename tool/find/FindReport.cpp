#include "tool/find/FindReport.h"

#include "platform/core/DateText.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/waveform/Sparkline.h"

#include <cmath>
#include <cstring>
#include <string_view>
#include <vector>

namespace {

constexpr int kSparklineCells = 12;

std::vector<const char*> columnKeys()
{
    std::vector<const char*> keys{"path", "fileLength", "modified"};
    for (const LibraryColumn& column : libraryColumns())
        keys.push_back(column.key);
    keys.insert(keys.end(), {"problems", "error"});
    return keys;
}

const std::vector<const char*>& csvColumns()
{
    static const std::vector<const char*> keys = columnKeys();
    return keys;
}

std::string modifiedText(const LibraryRecord& record)
{
    constexpr double kEpoch = 978'307'200; // 2001 in seconds since 1970
    return platform::dateText({static_cast<double>(record.stamp.modified) / 1e9 - kEpoch});
}

platform::Array descriptorList(std::string_view text)
{
    platform::Array list;
    while (!text.empty()) {
        const std::size_t comma = std::min(text.find(", "), text.size());
        list.emplace_back(std::string(text.substr(0, comma)));
        text.remove_prefix(std::min(comma + 2, text.size()));
    }
    return list;
}

// Adds a known value, as the other verbs write it.
struct MemberAdding {
    Record& to;
    const LibraryRecord& record;
    const char* key;

    void operator()(LibraryRecord::Text LibraryRecord::*member) const
    {
        if (member == &LibraryRecord::descriptors && !record.descriptors.empty())
            to.member(key, descriptorList(record.descriptors));
        else
            to.knownMember(key, record.*member);
    }
    void operator()(LibraryRecord::Whole LibraryRecord::*member) const
    {
        if (member == &LibraryRecord::floatingPoint && record.floatingPoint)
            to.member(key, *record.floatingPoint != 0);
        else
            to.knownMember(key, record.*member);
    }
    void operator()(LibraryRecord::Real LibraryRecord::*member) const
    {
        if (member == &LibraryRecord::sampleRate && record.sampleRate)
            to.member(key, std::llround(*record.sampleRate));
        else
            to.knownMember(key, record.*member);
    }
};

std::string sparklineOf(const LibraryRecord& record)
{
    if (!record.overview || record.overview->points.size() < sizeof(OverviewPoint))
        return {};
    std::vector<OverviewPoint> points(record.overview->points.size() / sizeof(OverviewPoint));
    std::memcpy(points.data(), record.overview->points.data(), points.size() * sizeof(OverviewPoint));
    // However many frames a point stands for, the line is the same.
    const auto frames = static_cast<std::int64_t>(points.size()) * kOverviewFramesPerPoint;
    return sparkline({points, frames, 1}, kSparklineCells);
}

std::string shownTempo(const LibraryRecord& record)
{
    return record.tempo ? fmt::format("{:.10g}", std::round(*record.tempo * 100) / 100) : "";
}

// To the tenth of a second where that matters.
std::string lengthOf(const LibraryRecord& record)
{
    constexpr double kMinute = 60;
    return record.durationSeconds ? clockText(*record.durationSeconds, *record.durationSeconds < kMinute ? 1 : 0) : "";
}

} // namespace

// Rows are written as they come, so the widths are fixed in advance; the path, which no width fits, comes last.
FindReport::FindReport(const OutputOptions& options, const LibraryQuery& query, PathEnd pathEnd)
    : query_(query),
      pathEnd_(pathEnd),
      form_(pathEnd == PathEnd::nul ? Form::lines : outputForm(options)),
      color_(usesColor(options.color)),
      table_({{.title = "WAVE", .width = kSparklineCells, .dropRank = 4},
              {.title = "TEMPO", .align = Align::right, .width = 6, .dropRank = 1},
              {.title = "KEY", .width = 8, .dropRank = 2},
              {.title = "TIME", .align = Align::right, .width = 7, .dropRank = 3},
              {.title = "CATEGORY", .width = 11, .dropRank = 5, .isCuttable = true},
              {.title = "FILE", .isCuttable = true}}),
      records_(options, csvColumns())
{
}

LibraryParts FindReport::parts() const
{
    return {.overview = form_ == Form::table, .problems = form_ == Form::json || form_ == Form::csv};
}

void FindReport::add(const LibraryRecord& record)
{
    if (form_ == Form::table) {
        addRow(record);
    } else if (form_ == Form::json || form_ == Form::csv) {
        addData(record);
    } else if (pathEnd_ == PathEnd::nul) { // for programs: the bytes of the name
        output_.write(shownPath(record));
        output_.write(std::string_view("\0", 1));
    } else {
        output_.print("{}\n", printable(shownName(shownPath(record))));
    }
}

void FindReport::fail(const std::string& path, const std::string& text)
{
    records_.addFailure(path, text);
    records_.finish();
}

void FindReport::addRow(const LibraryRecord& record)
{
    if (std::exchange(isFirst_, false))
        table_.printTitles(output_, color_);
    table_.printRow(output_, {sparklineOf(record), shownTempo(record), printable(record.key), lengthOf(record),
                              printable(record.category), printable(shownName(shownPath(record)))});
}

void FindReport::addData(const LibraryRecord& record)
{
    Record data;
    data.member("path", shownName(shownPath(record)));
    data.member("fileLength", record.stamp.size);
    data.member("modified", modifiedText(record));
    for (const LibraryColumn& column : libraryColumns())
        std::visit(MemberAdding{data, record, column.key}, column.member);
    platform::Array problems;
    for (const LibraryProblem& problem : record.problems)
        problems.push_back(form_ == Form::csv ? platform::Value(problem.kind)
                                              : platform::Dictionary{{"kind", problem.kind}, {"text", problem.text}});
    if (!problems.empty())
        data.member("problems", std::move(problems));
    records_.add(data);
}

// Below a folder that was named, files are named below it.
std::string FindReport::shownPath(const LibraryRecord& record) const
{
    std::string path = record.place.path();
    for (const LibraryQuery::Scope& scope : query_.scopes)
        if (path.starts_with(scope.path))
            return scope.typed + path.substr(scope.path.size());
    return path;
}
