#include "tool/shared/looptags/LoopTagFields.h"

#include "loops/VireoLoopChunks.h"
#include "loops/VireoLoopTerms.h"
#include "platform/String.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <limits>
#include <optional>
#include <set>
#include <sys/stat.h>

using Kind = TagField::Kind;
using platform::Value;

namespace {

constexpr std::int64_t kMost16 = std::numeric_limits<std::int16_t>::max();
constexpr std::int64_t kMost32 = std::numeric_limits<std::int32_t>::max();

constexpr TagField kFields[] = {
    {"beatCount", VireoLoopCombinedTagsChunkDataBeatCountKey, Kind::number, false, 0, kMost32},
    {"midiRootNote", VireoLoopCombinedTagsChunkDataMidiRootNoteKey, Kind::number, false, 0, 127},
    {"keyType", VireoLoopCombinedTagsChunkDataKeyType, Kind::number, false, 0, 4},
    {"signatureTop", VireoLoopCombinedTagsChunkDataSignatureTopKey, Kind::number, false, 1, kMost16},
    {"signatureBottom", VireoLoopCombinedTagsChunkDataSignatureBottomKey, Kind::number, false, 1, kMost16},
    {"loopFileType", VireoLoopCombinedTagsChunkDataFileTypeKey, Kind::number, false, 1, 2},
    {"instrumentType", VireoLoopCombinedTagsChunkDataInstrumentTypeKey, Kind::text},
    {"instrumentSubType", VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, Kind::text},
    {"genre", VireoLoopCombinedTagsChunkDataGenreKey, Kind::text},
    {"descriptors", VireoLoopCombinedTagsChunkDataDescriptorsKey, Kind::list},
    {"title", VireoLoopFileInfoChunkDataTitleKey, Kind::text, true},
    {"artist", VireoLoopFileInfoChunkDataArtistKey, Kind::text, true},
    {"copyright", VireoLoopFileInfoChunkDataCopyrightKey, Kind::text, true},
    {"comments", VireoLoopFileInfoChunkDataCommentsKey, Kind::text, true},
    {"transients", nullptr, Kind::transients},
};

[[noreturn]] void refuse(const std::string& message)
{
    throw UsageError(message);
}

[[noreturn]] void refuseValue(std::string_view key, std::string_view value, const std::string& expected)
{
    refuse(fmt::format("{}={}: {} expected", key, value, expected));
}

std::vector<std::string_view> split(std::string_view text, char separator)
{
    std::vector<std::string_view> parts;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find(separator), text.size());
        parts.push_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return parts;
}

std::string_view trimmed(std::string_view text)
{
    constexpr const char* kWhite = " \t\r\n\v\f";
    const std::size_t start = std::min(text.find_first_not_of(kWhite), text.size());
    return text.substr(start, text.find_last_not_of(kWhite) + 1 - start);
}

std::optional<std::int64_t> integer(std::string_view text)
{
    std::int64_t number = 0;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), number);
    return result.ec == std::errc() && result.ptr == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

Value numberValue(const TagField& field, std::string_view key, std::string_view text)
{
    const auto number = integer(text);
    if (!number || *number < field.least || *number > field.most)
        refuseValue(key, text, fmt::format("a whole number from {} to {}", field.least, field.most));
    return *number;
}

// A note's name, any of those for the same key: "F#" and "Gb", "B#" and "C".
Value noteValue(std::string_view text)
{
    const auto note = VireoLoopNoteNamed(text);
    if (!note)
        refuseValue("key", text, "a note such as C, F# or Bb");
    return *note;
}

Value modeValue(std::string_view text)
{
    const auto mode = VireoLoopModeNamed(text);
    if (!mode)
        refuseValue("mode", text, "none, minor, major, neither or both");
    return *mode;
}

Value descriptorsValue(std::string_view text)
{
    std::set<std::string> each;
    for (const std::string_view part : split(text, ','))
        if (const std::string_view descriptor = trimmed(part); !descriptor.empty())
            each.emplace(descriptor);
    return platform::Array(each.begin(), each.end());
}

Value transientsValue(std::string_view text)
{
    std::set<std::int64_t> frames;
    for (const std::string_view part : split(text, ',')) {
        const auto frame = integer(trimmed(part));
        if (!frame || *frame < 0)
            refuseValue("transients", part, "sample frames such as 0,11025,22050");
        frames.insert(*frame);
    }
    return platform::Array(frames.begin(), frames.end());
}

Value fieldValue(const TagField& field, std::string_view key, std::string_view text)
{
    if (text.empty())
        return {};
    if (key == "key")
        return noteValue(text);
    if (key == "mode")
        return modeValue(text);
    switch (field.kind) {
    case Kind::number:
        return numberValue(field, key, text);
    case Kind::list:
        return descriptorsValue(text);
    case Kind::transients:
        return transientsValue(text);
    case Kind::text:
        break;
    }
    return std::string(trimmed(text));
}

std::string knownKeys()
{
    std::string keys;
    for (const TagField& field : kFields)
        (keys += field.name) += ", ";
    return keys + "key, mode, signature";
}

void assign(std::vector<TagAssignment>& assignments, std::string_view key, std::string_view text)
{
    const auto fields = fieldsForKey(key);
    if (key == "tempo")
        refuse("the tempo follows from beats, length and sample rate: set beatCount");
    if (fields.empty())
        refuse(fmt::format("there is no tag \"{}\" (a file of that name is \"./{}={}\"); tags are {}", key, key, text,
                           knownKeys()));
    if (!platform::String::fromUTF8(text))
        refuse(fmt::format("the value of {} is not valid UTF-8", key));
    const auto parts = key == "signature" && !text.empty() ? split(text, '/') : std::vector{text};
    if (key == "signature" && !text.empty() && (parts.size() != fields.size() || text.ends_with('/')))
        refuseValue(key, text, "a signature such as 4/4");
    for (std::size_t i = 0; i < fields.size(); ++i) {
        for (const TagAssignment& earlier : assignments)
            if (earlier.field == fields[i])
                refuse(fmt::format("{} is set twice", fields[i]->name));
        assignments.push_back({fields[i], fieldValue(*fields[i], key, parts[std::min(i, parts.size() - 1)])});
    }
}

} // namespace

std::span<const TagField> tagFields()
{
    return kFields;
}

std::vector<const TagField*> fieldsForKey(std::string_view key)
{
    std::vector<std::string_view> names{key};
    if (key == "key")
        names = {"midiRootNote"};
    else if (key == "mode")
        names = {"keyType"};
    else if (key == "signature")
        names = {"signatureTop", "signatureBottom"};
    std::vector<const TagField*> fields;
    for (const TagField& field : kFields)
        if (std::find(names.begin(), names.end(), field.name) != names.end())
            fields.push_back(&field);
    return fields;
}

TagArguments parseAssignments(std::span<const std::string> arguments)
{
    TagArguments parsed;
    for (const std::string& argument : arguments) {
        const std::size_t equals = argument.find('=');
        if (equals == std::string::npos || argument.find('/') < equals)
            parsed.files.push_back(argument);
        else
            assign(parsed.assignments, std::string_view(argument).substr(0, equals),
                   std::string_view(argument).substr(equals + 1));
    }
    if (parsed.assignments.empty())
        refuse("KEY=VALUE is missing; keys are " + knownKeys());
    return parsed;
}

TagArguments parseKeys(std::span<const std::string> arguments)
{
    TagArguments parsed;
    for (const std::string& argument : arguments) {
        const auto fields = fieldsForKey(argument);
        struct stat status = {};
        // A misspelt key must not pass for a missing file: without keys all tags of the other files would go.
        if (fields.empty() && argument.find('/') == std::string::npos && ::lstat(argument.c_str(), &status) != 0)
            refuse(fmt::format("\"{}\" is neither a file nor a tag; tags are {}", printable(argument), knownKeys()));
        if (fields.empty())
            parsed.files.push_back(argument);
        for (const TagField* field : fields)
            parsed.assignments.push_back({field, {}});
    }
    return parsed;
}

std::string noteName(std::int64_t note)
{
    const std::string_view name = VireoLoopNoteName(note);
    return name.empty() ? std::to_string(note) : std::string(name);
}

std::string modeName(std::int64_t keyType)
{
    const std::string_view name = VireoLoopModeName(keyType);
    return name.empty() ? std::to_string(keyType) : std::string(name);
}

std::string carriedChunkName(const VireoLoopBaseChunk& chunk)
{
    return chunk.aifChunkID() != 0 ? fourCCText(chunk.aifChunkID()) : "silence";
}
