#include "tool/scan/ScanRecord.h"

#include "tool/shared/looptags/LoopTagFiles.h"
#include "tool/shared/looptags/LoopTagWords.h"
#include "tool/shared/looptags/LoopTagsCsv.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <iterator>
#include <new>
#include <unistd.h>

namespace {

bool isCalledLoop(const std::string& path)
{
    const std::size_t dot = path.rfind('.');
    std::string extension = dot == std::string::npos ? "" : path.substr(dot);
    constexpr std::string_view kExtensions[] = {".aif", ".aiff", ".aifc", ".caf", ".wav"};
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return std::ranges::find(kExtensions, extension) != std::end(kExtensions);
}

// The cells of a loop's row; keys are shown in words.
template <std::size_t count>
std::array<TagText, count> textsCalled(const char* const (&names)[count])
{
    std::array<TagText, count> texts;
    std::ranges::transform(names, texts.begin(),
                           [](std::string_view name) { return name == "key" ? keyWords : tagTextCalled(name); });
    return texts;
}

void fill(ScanRecord& record, const std::string& path, const LoopTags& tags, Form form)
{
    record.kind = ScanRecord::loop;
    record.loops = 1;
    if (form == Form::json) {
        JsonWriter json;
        writeLoopTags(json, shownName(path), tags);
        record.text = json.text();
    } else if (form == Form::csv) {
        record.text = loopRow(shownName(path), tags);
    } else if (form == Form::table) {
        static const auto texts = textsCalled({"tempo", "beatCount", "key", "signature", "instrumentType", "genre"});
        for (const TagText text : texts)
            record.cells.push_back(text(tags));
        record.cells.push_back(printable(shownName(path)));
    } else if (form == Form::lines) {
        record.text = printable(shownName(path));
        (record.text += '\t') += loopContainerName(tags.fileType);
        static const auto texts = textsCalled(
            {"tempo", "beatCount", "key", "signature", "instrumentType", "instrumentSubType", "genre", "descriptors"});
        for (const TagText text : texts)
            (record.text += '\t') += text(tags);
        record.text += '\n';
    }
}

} // namespace

ScanRecord scanFile(const FoundFile& item, Form form)
{
    ScanRecord record;
    const auto fail = [&](const std::string& text) { record = {ScanRecord::bad, item.path, text, {}}; };
    if (!item.problem.empty()) {
        fail(item.problem);
        return record;
    }
    try {
        if (const LoopTags tags = loopTagsOf(item.path); tags.isLoop())
            fill(record, item.path, tags, form);
    } catch (const OtherKind& other) {
        if (!other.isAudio() && isCalledLoop(item.path))
            fail(other.what());
    } catch (const Failure& failure) {
        // A dangling link matters only if its name is that of a loop.
        if (isCalledLoop(item.path) || ::access(item.path.c_str(), F_OK) == 0)
            fail(failure.what());
    } catch (const std::bad_alloc&) {
        fail("out of memory");
    }
    return record;
}

void addTo(std::vector<ScanRecord>& records, ScanRecord record, Form form)
{
    if (record.kind == ScanRecord::none)
        return;
    const bool isLine = record.kind == ScanRecord::loop && (form == Form::lines || form == Form::none);
    if (!isLine || records.empty() || records.back().kind != ScanRecord::loop) {
        records.push_back(std::move(record));
        return;
    }
    records.back().text += record.text;
    records.back().loops += record.loops;
}

// Rows are written as they come, so the widths are fixed in advance; the path, which no width fits, comes last.
ScanWriter::ScanWriter(Form form, const OutputOptions& options)
    : form_(form),
      color_(usesColor(options.color)),
      table_({{.title = "TEMPO", .align = Align::right, .width = 7},
              {.title = "BEATS", .align = Align::right, .dropRank = 2},
              {.title = "KEY", .width = 8, .dropRank = 1},
              {.title = "SIGNATURE", .dropRank = 4},
              {.title = "CATEGORY", .width = 16, .dropRank = 3, .isCuttable = true},
              {.title = "GENRE", .width = 16, .dropRank = 5, .isCuttable = true},
              {.title = "FILE", .isCuttable = true}}),
      json_(options),
      csv_(options, loopColumns())
{
}

void ScanWriter::add(const ScanRecord& record)
{
    if (record.kind == ScanRecord::bad) {
        json_.addFailure(record.path, record.text);
        csv_.addFailure(record.path, record.text);
        return;
    }
    const bool first = std::exchange(first_, false);
    if (form_ == Form::table) {
        if (first)
            table_.printTitles(output_, color_);
        table_.printRow(output_, record.cells);
        return;
    }
    if (form_ == Form::json) {
        json_.begin().writeJson(record.text);
        json_.end();
    } else if (form_ == Form::csv) {
        csv_.addRow(record.text);
    } else {
        output_.write(record.text);
    }
}

void ScanWriter::finish()
{
    json_.finish();
    csv_.finish();
}
