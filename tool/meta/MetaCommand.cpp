#include "tool/meta/MetaCommand.h"

#include "tool/meta/FileMetadata.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/CsvRecords.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/JsonRecords.h"

#include <algorithm>

namespace {

struct MetaOptions {
    MetaGroups only;
    unsigned threads = 0;
};

constexpr std::size_t kIdLength = 4;
constexpr const char* kLatin1 = "ISO-8859-1";

std::string valueText(const MetaField& field)
{
    return std::visit([](const auto& value) { return fmt::format("{}", value); }, field.value);
}

std::string timeText(double seconds)
{
    return clockText(seconds, 3, ShowHours::always);
}

/// A value as people read it: "480000 (0:00:10.000)", "-23 LUFS", "12 bytes: 0a00 |..|".
std::string readable(const MetaField& field)
{
    const std::string value = printable(valueText(field));
    if (field.byteSize)
        return fmt::format("{}{}{} bytes: {}{} |{}|", printable(field.words), field.words.empty() ? "" : ", ",
                           *field.byteSize, value, value.size() < *field.byteSize * 2 ? "…" : "", field.ascii);
    if (field.seconds)
        return fmt::format("{} ({})", value, timeText(*field.seconds));
    const bool isNumber = !std::holds_alternative<std::string>(field.value);
    return isNumber && !field.words.empty() ? fmt::format("{} {}", value, printable(field.words)) : value;
}

void tellValue(const MetaField& field, JsonWriter& json)
{
    std::visit([&](const auto& value) { json.member("value", value); }, field.value);
}

/// As text, since a record's numbers have a sign.
void tellValue(const MetaField& field, Record& record)
{
    record.member("value", valueText(field));
}

/// The keys of JSON and the columns of CSV; `sink` is either's record, `name` the field's.
template <class Sink>
void tell(const MetaField& field, const std::string& name, Sink& sink)
{
    sink.member("field", name);
    tellValue(field, sink);
    sink.knownMember("words", field.words).knownMember("seconds", field.seconds);
    sink.knownMember("size", field.byteSize).knownMember("ascii", field.ascii);
    if (field.isLatin1)
        sink.member("encoding", kLatin1);
    if (field.chunk != 0)
        sink.member("chunk", fourCCText(field.chunk)).member("offset", field.offset);
}

// Writes the fields of one file after the other, each as soon as they are read.
class MetaWriter {
public:
    /// With `several` files each line says which.
    MetaWriter(const OutputOptions& options, bool several)
        : form_(outputForm(options)),
          color_(usesColor(options.color)),
          several_(several),
          json_(options),
          csv_(options, kColumns)
    {
    }

    void add(const std::string& path, const FileMetadata& metadata)
    {
        if (form_ == Form::csv)
            addRows(path, metadata);
        else if (form_ == Form::json)
            addRecord(path, metadata);
        else if (form_ == Form::table)
            addTree(path, metadata);
        else if (form_ == Form::lines)
            for (const MetaField& field : metadata.fields)
                output_.print("{}{}{}\t{}{}{}\n", several_ ? printable(path) : "", several_ ? "\t" : "",
                              printable(field.fullName()),
                              field.byteSize ? readable(field) : printable(valueText(field)), field.seconds ? "\t" : "",
                              field.seconds ? timeText(*field.seconds) : "");
    }

    void addFailure(const std::string& path, const std::string& text)
    {
        json_.addFailure(path, text);
        csv_.addFailure(path, text);
    }

    void finish()
    {
        json_.finish();
        csv_.finish();
    }

private:
    void addRecord(const std::string& path, const FileMetadata& metadata)
    {
        JsonWriter& json = json_.begin();
        json.beginObject().member("path", path);
        if (metadata.container != 0)
            json.member("container", fourCCText(metadata.container));
        json.key("fields").beginArray();
        for (const MetaField& field : metadata.fields) {
            name_.clear();
            field.appendFullName(name_);
            tell(field, name_, json.newLine().beginObject());
            json.endObject();
        }
        json.endArrayOfLines().endObject();
        json_.end();
    }

    /// One for each field; of a file that says nothing one that has the path alone.
    void addRows(const std::string& path, const FileMetadata& metadata)
    {
        const Record file = Record().member("path", path);
        if (metadata.fields.empty())
            csv_.add(file);
        for (const MetaField& field : metadata.fields) {
            Record record = file;
            tell(field, field.fullName(), record);
            csv_.add(record);
        }
    }

    /// A heading for each chunk, its fields below it, their values in one column.
    void addTree(const std::string& path, const FileMetadata& metadata)
    {
        constexpr int widest = 40;
        output_.print("{}{}{}{}{}{}\n", isFirst_ ? "" : "\n", bold(), printable(path), plain(),
                      metadata.container != 0 ? "  " : "",
                      metadata.container != 0 ? fourCCText(metadata.container) : "");
        isFirst_ = false;
        const MetaField* above = nullptr;
        for (const MetaField& field : metadata.fields) {
            const bool isNewPlace = above == nullptr || above->place != field.place || above->offset != field.offset;
            if (isNewPlace) {
                width_ = 0;
                for (const MetaField& other : metadata.fields)
                    if (other.place == field.place && other.offset == field.offset)
                        width_ = std::max(width_, std::min(displayWidth(label(other)), widest));
                const std::string chunk =
                    field.chunk != 0 ? fmt::format("  \"{}\" at {}", fourCCText(field.chunk), field.offset) : "";
                output_.print("  {}{}{}{}\n", bold(), printable(field.place), plain(), chunk);
            }
            const std::string text = label(field);
            const int room = std::max(width_ - displayWidth(text), 0);
            output_.print("    {}{:{}}{}{}{}\n", text, "", room, width_ == 0 ? "" : "  ", readable(field),
                          field.isLatin1 ? " [Latin-1]" : "");
            above = &field;
        }
        if (metadata.fields.empty())
            output_.write("  no metadata\n");
    }

    /// What stands ahead of a value; of a text its id's meaning too.
    static std::string label(const MetaField& field)
    {
        const bool isNamedText =
            std::holds_alternative<std::string>(field.value) && !field.byteSize && !field.words.empty();
        return printable(field.name) + (isNamedText ? " " + printable(field.words) : "");
    }

    const char* bold() const { return color_ ? "\x1b[1m" : ""; }
    const char* plain() const { return color_ ? "\x1b[0m" : ""; }

    static constexpr const char* kColumns[] = {"path",  "field",    "value", "seconds", "words", "size",
                                               "ascii", "encoding", "chunk", "offset",  "error"};

    Form form_;
    bool color_;
    bool several_;
    bool isFirst_ = true;
    int width_ = 0;
    std::string name_; // of the field that is written
    Output& output_ = Output::standard();
    JsonRecords json_;
    CsvRecords csv_;
};

std::string lowered(std::string text)
{
    for (char& c : text)
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    return text;
}

} // namespace

MetaGroups metaGroupsFromText(const std::string& text)
{
    const std::vector<std::string> known = metaGroups();
    MetaGroups groups;
    for (std::size_t begin = 0; begin <= text.size();) {
        const std::size_t end = std::min(text.find(',', begin), text.size());
        const std::string group = lowered(text.substr(begin, end - begin));
        if (group.empty() || (group.size() > kIdLength && std::ranges::find(known, group) == known.end()))
            throw UsageError("\"" + printable(group) +
                             "\" names no fields: bext, ixml, info, cue, id3v2 … or a chunk's id");
        groups.push_back(group);
        begin = end + 1;
    }
    return groups;
}

namespace {

bool runMeta(const FileArguments& files, const MetaOptions& wanted, const OutputOptions& options)
{
    MetaWriter writer(options, files.maybeSeveral());
    const FileLoop loop{.threads = wanted.threads, .quiet = options.quiet};
    return writeFileByFile(writer, files, loop, [&](const FoundFile& file) {
        const FileAccess access = accessForReading(file.path, {.quiet = options.quiet});
        return readMetadata(file.path, wanted.only);
    });
}

void declareMeta(CommandLine& commandLine)
{
    static FileArguments files;
    static MetaOptions wanted;
    static std::string only;
    Verb& verb = commandLine.addVerb("meta", "Show what files say about themselves, by field; set or remove fields",
                                     [&commandLine] {
                                         if (!only.empty())
                                             wanted.only = metaGroupsFromText(only);
                                         return runMeta(files, wanted, commandLine.output());
                                     });
    CommandLine::addFilesOrInput(verb, files);
    addThreads(verb, wanted.threads);
    commandLine.addCsv(verb);
    verb.addText("--only", only, "Only these, behind commas: bext, ixml, info, cue, smpl, … or ids of chunks")
        .label("GROUPS");
    declareMetaEdits(commandLine, verb);
    declareMetaCopy(commandLine, verb);
    declareMetaExport(commandLine, verb);
    declareMetaImport(commandLine, verb);
}

const VerbRegistration registration{35, declareMeta};

} // namespace
