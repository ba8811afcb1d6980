#include "tool/scan/ScanRecord.h"

#include "tool/shared/looptags/LoopTags.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"

#include <algorithm>
#include <cctype>
#include <iterator>
#include <new>
#include <unistd.h>

namespace {

// The columns of CSV, by the names that JSON has for them.
constexpr const char* kColumns[] = {
    "path",         "fileType",        "containerName", "sampleRate",   "frames",         "durationSeconds",
    "tempo",        "beatCount",       "midiRootNote",  "key",          "keyType",        "mode",
    "signatureTop", "signatureBottom", "signature",     "loopFileType", "instrumentType", "instrumentSubType",
    "genre",        "descriptors",     "title",         "artist",       "copyright",      "comments",
    "transients",   "chunks"};

bool isCalledLoop(const std::string& path)
{
    const std::size_t dot = path.rfind('.');
    std::string extension = dot == std::string::npos ? "" : path.substr(dot);
    constexpr std::string_view kExtensions[] = {".aif", ".aiff", ".aifc", ".caf", ".wav"};
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return std::ranges::find(kExtensions, extension) != std::end(kExtensions);
}

// As it is, which programs want; a terminal must not take part of a name for a command.
void appendField(std::string& line, std::string_view bytes)
{
    static const bool onTerminal = isTerminal(STDOUT_FILENO);
    const std::string fit = onTerminal ? printable(bytes) : std::string();
    const std::string_view text = onTerminal ? fit : bytes;
    if (text.find_first_of(",\"\r\n") == std::string_view::npos) {
        line += text;
        return;
    }
    line += '"';
    for (const char c : text)
        line.append(c == '"' ? 2 : 1, c);
    line += '"';
}

// Numbers as they are, lists joined with commas.
std::string fieldText(const platform::Value& value)
{
    if (const auto* text = value.get<std::string>())
        return *text;
    if (const auto* list = value.get<platform::Array>()) {
        std::string joined;
        for (const platform::Value& each : *list)
            joined += (joined.empty() ? "" : ",") + fieldText(each);
        return joined;
    }
    JsonWriter number;
    number.write(value);
    return std::string(number.text());
}

std::string chunkIds(const LoopTags& tags)
{
    std::string joined;
    for (const LoopTags::Chunk& chunk : tags.chunks)
        joined += (joined.empty() ? "" : ",") + chunk.id;
    return joined;
}

std::string csvLine(const std::string& path, const LoopTags& tags)
{
    std::vector<TagValue> values = tagRecord(tags);
    values.push_back({"transients", tags.transients.size()});
    values.push_back({"chunks", chunkIds(tags)});
    std::string line;
    appendField(line, path);
    for (const char* column : std::span(kColumns).subspan(1)) {
        line += ',';
        if (const auto found = std::ranges::find(values, column, &TagValue::name); found != values.end())
            appendField(line, fieldText(found->value));
    }
    return line + "\r\n";
}

// The tags of `names`, each in one line.
std::vector<std::string> cells(const LoopTags& tags, std::initializer_list<const char*> names)
{
    std::vector<std::string> row;
    for (const char* name : names)
        row.push_back(name == std::string_view("key") ? keyWords(tags) : tagText(tags, name));
    return row;
}

void fill(ScanRecord& record, const LoopTags& tags, ScanForm form)
{
    record.kind = ScanRecord::loop;
    if (form == ScanForm::json) {
        JsonWriter json;
        writeLoopTags(json, shownName(record.path), tags);
        record.text = json.text();
    } else if (form == ScanForm::csv) {
        record.text = csvLine(shownName(record.path), tags);
    } else if (form == ScanForm::table) {
        record.cells = cells(tags, {"tempo", "beatCount", "key", "signature", "instrumentType", "genre"});
        record.cells.push_back(printable(shownName(record.path)));
    } else if (form == ScanForm::lines) {
        record.text = printable(shownName(record.path)) + "\t" + loopContainerName(tags.fileType);
        for (const std::string& cell : cells(tags, {"tempo", "beatCount", "key", "signature", "instrumentType",
                                                    "instrumentSubType", "genre", "descriptors"}))
            record.text += "\t" + cell;
        record.text += '\n';
    }
}

} // namespace

ScanForm scanForm(Form form)
{
    switch (form) {
    case Form::table:
        return ScanForm::table;
    case Form::lines:
        return ScanForm::lines;
    case Form::json:
        return ScanForm::json;
    case Form::none:
        break;
    }
    return ScanForm::none;
}

ScanRecord scanFile(const FoundFile& item, ScanForm form)
{
    ScanRecord record;
    record.path = item.path;
    const auto fail = [&](const std::string& text) {
        record.kind = ScanRecord::bad;
        record.text = text;
    };
    if (!item.problem.empty()) {
        fail(item.problem);
        return record;
    }
    try {
        if (const LoopTags tags = readLoopTags(item.path); tags.isLoop())
            fill(record, tags, form);
    } catch (const OtherKind& other) {
        if (!other.isAudio() && isCalledLoop(item.path))
            fail(other.what());
    } catch (const Failure& failure) {
        // A link that leads nowhere is of interest only when it should lead to a loop.
        if (isCalledLoop(item.path) || ::access(item.path.c_str(), F_OK) == 0)
            fail(failure.what());
    } catch (const std::bad_alloc&) {
        fail("out of memory");
    }
    return record;
}

// Rows are written as they come, so that the widths are set beforehand; the path, which no width fits, comes last.
ScanWriter::ScanWriter(ScanForm form, const OutputOptions& options)
    : form_(form),
      color_(usesColor(options.color)),
      table_({{.title = "TEMPO", .align = Align::right, .width = 7},
              {.title = "BEATS", .align = Align::right, .dropRank = 2},
              {.title = "KEY", .width = 8, .dropRank = 1},
              {.title = "SIGNATURE", .dropRank = 4},
              {.title = "CATEGORY", .width = 16, .dropRank = 3, .isCuttable = true},
              {.title = "GENRE", .width = 16, .dropRank = 5, .isCuttable = true},
              {.title = "FILE", .isCuttable = true}}),
      json_(options)
{
    if (form_ != ScanForm::csv)
        return;
    for (const char* column : kColumns)
        output_.print("{}{}", column == kColumns[0] ? "" : ",", column);
    output_.write("\r\n");
}

void ScanWriter::add(const ScanRecord& record)
{
    if (record.kind == ScanRecord::bad) {
        if (form_ == ScanForm::json)
            json_.addFailure(record.path, record.text);
        return;
    }
    const bool first = std::exchange(first_, false);
    if (form_ == ScanForm::table) {
        if (first)
            table_.printTitles(output_, color_);
        table_.printRow(output_, record.cells);
        return;
    }
    if (form_ == ScanForm::json) {
        json_.begin().writeJson(record.text);
        json_.end();
    } else {
        output_.write(record.text);
    }
}

void ScanWriter::finish()
{
    if (form_ == ScanForm::json)
        json_.finish();
}
