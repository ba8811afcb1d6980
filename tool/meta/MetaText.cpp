#include "tool/meta/MetaText.h"

#include "platform/core/JsonWriter.h"
#include "tool/shared/output/ClockTime.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/HeadingName.h"

#include <algorithm>

namespace {

std::string valueText(const MetaField& field)
{
    return std::visit([](const auto& value) { return fmt::format("{}", value); }, field.value);
}

std::string timeText(double seconds)
{
    return clockText(seconds, 3, ShowHours::always);
}

/// A value for people: "480000 (0:00:10.000)", "-23 LUFS", "12 bytes: 0a00 |..|".
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

/// As text, because numbers in a record are signed.
void tellValue(const MetaField& field, Record& record)
{
    record.member("value", valueText(field));
}

/// Keys in JSON and columns in CSV; `sink` is the record of either, `name` the field's.
template <class Sink>
void tell(const MetaField& field, const std::string& name, Sink& sink)
{
    sink.member("field", name);
    tellValue(field, sink);
    sink.knownMember("words", field.words).knownMember("seconds", field.seconds);
    sink.knownMember("size", field.byteSize).knownMember("ascii", field.ascii);
    if (field.encoding != nullptr)
        sink.member("encoding", field.encoding);
}

/// The field's place.
template <class Sink>
void tellOrigin(const MetaField& field, Sink& sink)
{
    if (field.chunk != 0)
        sink.member("chunk", fourCCText(field.chunk)).member("offset", field.offset);
}

/// The label of a value; for a text it includes the meaning of its id.
std::string label(const MetaField& field)
{
    const bool isNamedText =
        std::holds_alternative<std::string>(field.value) && !field.byteSize && !field.words.empty();
    return printable(field.name) + (isNamedText ? " " + printable(field.words) : "");
}

/// One row per field; a file without fields has a row with its path alone.
std::string rows(const std::string& path, const FileMetadata& metadata)
{
    const Record file = Record().member("path", path);
    std::string text = metadata.fields.empty() ? csvRow(metaColumns(), file) : "";
    for (const MetaField& field : metadata.fields) {
        Record record = file;
        tell(field, field.fullName(), record);
        tellOrigin(field, record);
        text += csvRow(metaColumns(), record);
    }
    return text;
}

} // namespace

CsvColumns metaColumns()
{
    static constexpr const char* columns[] = {"path",  "field",    "value", "seconds", "words", "size",
                                              "ascii", "encoding", "chunk", "offset",  "error"};
    return columns;
}

MetaText::MetaText(const OutputOptions& options, bool several)
    : form_(outputForm(options)),
      keepsToOneLine_(options.json == JsonShape::lines),
      color_(usesColor(options.color)),
      several_(several)
{
}

std::string MetaText::of(const std::string& path, const FileMetadata& metadata) const
{
    switch (form_) {
    case Form::table:
        return tree(path, metadata);
    case Form::lines:
        return lines(path, metadata);
    case Form::json:
        return json(path, metadata);
    case Form::csv:
        return rows(path, metadata);
    case Form::none:
        break;
    }
    return {};
}

std::string MetaText::json(const std::string& path, const FileMetadata& metadata) const
{
    JsonWriter json;
    if (keepsToOneLine_)
        json.keepToOneLine();
    json.beginObject().member("path", path);
    if (metadata.container != 0)
        json.member("container", fourCCText(metadata.container));
    json.key("fields").beginArray();
    std::string name, origin; // members shared by all fields of a chunk
    const MetaField* above = nullptr;
    for (const MetaField& field : metadata.fields) {
        name.clear();
        field.appendFullName(name);
        tell(field, name, json.newLine().beginObject());
        if (above == nullptr || above->chunk != field.chunk || above->offset != field.offset) {
            JsonWriter members;
            tellOrigin(field, members);
            origin = members.text();
        }
        if (!origin.empty())
            json.writeJson(origin);
        json.endObject();
        above = &field;
    }
    json.endArrayOfLines().endObject();
    return std::string(json.text());
}

std::string MetaText::lines(const std::string& path, const FileMetadata& metadata) const
{
    std::string text;
    for (const MetaField& field : metadata.fields) {
        if (several_)
            (text += printable(path)) += '\t';
        (text += printable(field.fullName())) += '\t';
        text += field.byteSize ? readable(field) : printable(valueText(field));
        if (field.seconds)
            (text += '\t') += timeText(*field.seconds);
        text += '\n';
    }
    return text;
}

/// A heading per chunk, its fields below it with their values in one column.
std::string MetaText::tree(const std::string& path, const FileMetadata& metadata) const
{
    constexpr int widest = 40;
    const char* const bold = color_ ? "\x1b[1m" : "";
    const char* const plain = color_ ? "\x1b[0m" : "";
    const std::string rest = metadata.container != 0 ? "  " + fourCCText(metadata.container) : "";
    std::string text = fmt::format("{}{}{}{}\n", bold, headingName(path, rest), plain, rest);
    for (auto field = metadata.fields.begin(); field != metadata.fields.end();) {
        const auto isOfPlace = [&first = *field](const MetaField& other) {
            return other.place == first.place && other.offset == first.offset;
        };
        const auto end = std::find_if_not(field, metadata.fields.end(), isOfPlace);
        const std::string chunk =
            field->chunk != 0 ? fmt::format("  \"{}\" at {}", fourCCText(field->chunk), field->offset) : "";
        text += fmt::format("  {}{}{}{}\n", bold, printable(field->place), plain, chunk);
        int width = 0;
        for (auto other = field; other != end; ++other)
            width = std::max(width, std::min(displayWidth(label(*other)), widest));
        for (; field != end; ++field) {
            const std::string head = label(*field);
            text += fmt::format("    {}{:{}}{}{}{}\n", head, "", std::max(width - displayWidth(head), 0),
                                width == 0 ? "" : "  ", readable(*field),
                                field->encoding != nullptr ? fmt::format(" [{}]", field->encoding) : "");
        }
    }
    if (metadata.fields.empty())
        text += "  no metadata\n";
    return text;
}
