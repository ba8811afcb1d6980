#include "tool/shared/indexing/FieldTexts.h"

#include "platform/core/ASCIICase.h"
#include "platform/core/JsonWriter.h"
#include "platform/core/UTF8.h"
#include "tool/shared/indexing/BoundedText.h"
#include "tool/shared/library/KeyText.h"
#include "tool/shared/library/LibraryRecord.h"

#include <algorithm>
#include <charconv>
#include <optional>
#include <string_view>

namespace {

// Full names of fields in the order of preference, whatever their case; "=TITLE" stands for the fields of ID3, Vorbis,
// MP4, APE and ASF that programs call so whatever the system.
using FieldNames = std::span<const std::string_view>;

constexpr std::string_view kTitlesFields[] = {"=TITLE", "info.INAM", "NAME", "info.title", "cart.title"};
constexpr std::string_view kArtistsFields[] = {"=ARTIST",     "info.IART", "AUTH",           "info.artist",
                                               "cart.artist", "=COMPOSER", "bext.originator"};
constexpr std::string_view kAlbumsFields[] = {"=ALBUM", "info.IPRD", "info.album"};
constexpr std::string_view kGenresFields[] = {"=GENRE", "info.IGNR", "info.genre"};
constexpr std::string_view kCommentsFields[] = {"=COMMENT",      "info.ICMT", "bext.description", "info.comment",
                                                "info.comments", "ANNO",      "COMT[0].text",     "=DESCRIPTION"};
constexpr std::string_view kDatesFields[] = {"bext.originationDate", "=DATE",     "=RECORDINGDATE", "info.ICRD",
                                             "info.recorded date",   "info.date", "info.year"};
constexpr std::string_view kTemposFields[] = {"=BPM", "=TEMPO", "info.IBPM", "info.tempo"};
constexpr std::string_view kKeysFields[] = {"=INITIALKEY", "=KEY", "info.IKEY", "info.key signature"};

constexpr std::size_t kMostOfValue = 4096;     // bytes of a value among the fields
constexpr std::size_t kMostOfFields = 1 << 18; // bytes of all fields

bool isTagSystem(const MetaField& field)
{
    constexpr std::string_view kGroups[] = {"id3", "id3v1", "id3v2", "vorbis", "ape", "mp4", "asf", "tag"};
    return std::ranges::find(kGroups, field.group) != std::end(kGroups);
}

/// The last part of a key that says what it is: "initialkey" of "----:com.maker:initialkey", "KEY" of "TXXX:KEY".
std::string_view ownName(std::string_view key)
{
    const std::size_t colon = key.rfind(':');
    return colon == key.npos ? key : key.substr(colon + 1);
}

bool isCalled(const MetaField& field, std::string_view name)
{
    if (!name.starts_with('='))
        return equalIgnoringASCIICase(field.fullName(), name);
    name.remove_prefix(1);
    if (!isTagSystem(field))
        return false;
    return equalIgnoringASCIICase(field.words, name) || equalIgnoringASCIICase(ownName(field.name), name);
}

std::string lineOf(const MetaField& field, std::size_t most)
{
    if (field.byteSize)
        return {}; // bytes, not a text
    if (const auto* const text = std::get_if<std::string>(&field.value))
        return boundedLine(*text, most);
    return std::visit(
        [](const auto& value) {
            JsonWriter json;
            json.write(value);
            return std::string(json.text());
        },
        field.value);
}

/// Passes the text of each field of the names to `take`, until that returns true.
template <class Take>
void takeFirst(FieldNames names, std::span<const MetaField> fields, std::size_t most, Take take)
{
    for (const std::string_view name : names)
        for (const MetaField& field : fields)
            if (isCalled(field, name))
                if (const std::string text = lineOf(field, most); !text.empty() && take(text, field))
                    return;
}

/// None for what is no tempo of music.
std::optional<double> tempoOfText(std::string_view text)
{
    constexpr double kMost = 1000;
    double tempo = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), tempo);
    const std::string_view rest(end, static_cast<std::size_t>(text.data() + text.size() - end));
    const bool isNumber = rest.empty() || equalIgnoringASCIICase(rest, "bpm") || equalIgnoringASCIICase(rest, " bpm");
    return error == std::errc() && isNumber && tempo > 0 && tempo < kMost ? std::optional(tempo) : std::nullopt;
}

void writeValue(JsonWriter& json, const MetaField& field)
{
    const auto* const text = std::get_if<std::string>(&field.value);
    if (text == nullptr) {
        std::visit([&](const auto& value) { json.member("value", value); }, field.value);
        return;
    }
    std::string_view whole = *text;
    while (text->size() > kMostOfValue && text->size() - whole.size() < kMostOfValue)
        platform::takeCharacter(whole); // cut between characters
    const std::string_view shown =
        std::string_view(*text).substr(0, text->size() > kMostOfValue ? text->size() - whole.size() : text->size());
    json.member("value", shown);
    if (field.byteSize)
        json.member("size", *field.byteSize);
    else if (shown.size() < text->size())
        json.member("size", text->size());
}

} // namespace

void addFieldTexts(LibraryRecord& record, std::span<const MetaField> fields)
{
    const struct {
        std::string LibraryRecord::*member;
        FieldNames names;
        std::size_t most;
    } kTextColumns[] = {{&LibraryRecord::title, kTitlesFields, kMostOfLine},
                        {&LibraryRecord::artist, kArtistsFields, kMostOfLine},
                        {&LibraryRecord::album, kAlbumsFields, kMostOfLine},
                        {&LibraryRecord::genre, kGenresFields, kMostOfLine},
                        {&LibraryRecord::comment, kCommentsFields, kMostOfComment},
                        {&LibraryRecord::recorded, kDatesFields, kMostOfLine}};
    for (const auto& [member, names, most] : kTextColumns)
        if ((record.*member).empty())
            takeFirst(names, fields, most, [&, member = member](const std::string& text, const MetaField&) {
                record.*member = text;
                return true;
            });
    if (!record.tempo)
        takeFirst(kTemposFields, fields, kMostOfLine, [&](const std::string& text, const MetaField& field) {
            record.tempo = tempoOfText(text);
            record.tempoSource = record.tempo ? field.fullName() : "";
            return record.tempo.has_value();
        });
    if (!record.keyNote)
        takeFirst(kKeysFields, fields, kMostOfLine, [&](const std::string& text, const MetaField& field) {
            const auto key = keyOfText(text);
            if (!key)
                return false;
            record.keyNote = key->note;
            record.mode = key->mode;
            record.key = keyText(key->note, key->mode);
            record.keySource = boundedLine(field.fullName(), kMostOfLine);
            return true;
        });
}

std::string fieldsJson(std::span<const MetaField> fields)
{
    if (fields.empty())
        return {};
    JsonWriter json;
    json.beginArray();
    std::string name;
    std::size_t told = 0;
    for (const MetaField& field : fields) {
        if (json.text().size() > kMostOfFields) {
            json.beginObject().member("name", "…").member("value", fields.size() - told);
            json.member("words", "more fields").endObject();
            break;
        }
        name.clear();
        field.appendFullName(name);
        json.beginObject().member("name", name);
        writeValue(json, field);
        json.knownMember("words", field.words).endObject();
        ++told;
    }
    json.endArray();
    return std::string(json.text());
}
