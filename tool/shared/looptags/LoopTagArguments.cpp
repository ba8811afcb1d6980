#include "tool/shared/looptags/LoopTagArguments.h"

#include "loops/VireoLoopTerms.h"
#include "platform/String.h"
#include "platform/core/ASCIICase.h"
#include "tool/shared/arguments/Nearest.h"
#include "tool/shared/arguments/QuotedText.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <map>
#include <optional>
#include <set>
#include <sys/stat.h>

using Kind = LoopTagField::Kind;
using platform::Value;

namespace {

[[noreturn]] void refuse(const std::string& message)
{
    throw UsageError(message);
}

[[noreturn]] void refuseValue(std::string_view key, std::string_view value, const std::string& expected)
{
    refuse(fmt::format("{}={}: {} expected", key, printable(value), expected));
}

std::string_view spaceless(std::string_view text)
{
    constexpr const char* kWhite = " \t\r\n\v\f";
    const std::size_t start = std::min(text.find_first_not_of(kWhite), text.size());
    return text.substr(start, text.find_last_not_of(kWhite) + 1 - start);
}

// A text without white space around it, or the meaning of a quoted one.
std::string meantText(std::string_view text)
{
    text = spaceless(text);
    if (!isQuoted(text))
        return std::string(text);
    std::string meant = takeQuotedText(text);
    if (!text.empty())
        refuse(fmt::format("\"{}\" follows a value in $'…'", printable(text)));
    return meant;
}

// The members of a list, separated by commas; quoted members may contain commas.
std::set<std::string> members(std::string_view text)
{
    std::set<std::string> each;
    while (!text.empty()) {
        std::string_view rest = spaceless(text);
        if (isQuoted(rest))
            takeQuotedText(rest);
        const std::size_t end =
            std::min(text.find(',', static_cast<std::size_t>(rest.data() - text.data())), text.size());
        if (std::string member = meantText(text.substr(0, end)); !member.empty())
            each.insert(std::move(member));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return each;
}

std::optional<std::int64_t> integer(std::string_view text)
{
    std::int64_t number = 0;
    const auto result = std::from_chars(text.data(), text.data() + text.size(), number);
    return result.ec == std::errc() && result.ptr == text.data() + text.size() ? std::optional(number) : std::nullopt;
}

// Words for a field's numbers: notes under any name of the key ("F#" and "Gb"), modes, kinds.
std::optional<std::int64_t> numberOfWord(const LoopTagField& field, std::string_view text)
{
    const std::string_view name = field.name;
    if (name == "midiRootNote")
        return VireoLoopNoteNamed(text);
    if (name == "keyType") {
        constexpr std::pair<std::string_view, std::int64_t> others[] = {
            {"m", 1}, {"min", 1}, {"maj", 2}, {"neither major nor minor", 3}, {"major and minor", 4}};
        for (const auto& [word, mode] : others)
            if (word == text)
                return mode;
        std::string word(text);
        std::ranges::transform(word, word.begin(), asciiLower);
        return VireoLoopModeNamed(word);
    }
    if (name == "loopFileType")
        return equalIgnoringASCIICase(text, "loop")         ? std::optional<std::int64_t>(1)
               : equalIgnoringASCIICase(text, "not a loop") ? std::optional<std::int64_t>(2)
                                                            : std::nullopt;
    return std::nullopt;
}

std::optional<std::int64_t> numberOf(const LoopTagField& field, std::string_view text)
{
    const auto number = integer(text);
    return number ? number : numberOfWord(field, text);
}

std::string expectedOf(const LoopTagField& field)
{
    constexpr std::pair<std::string_view, std::string_view> words[] = {
        {"midiRootNote", "a note such as C, F# or Bb, or "},
        {"keyType", "none, minor, major, neither or both, or "},
        {"loopFileType", "loop or \"not a loop\", or "}};
    const auto* const found = std::ranges::find(words, field.name, [](const auto& each) { return each.first; });
    return fmt::format("{}a whole number from {} to {}", found != std::end(words) ? found->second : "", field.least,
                       field.most);
}

Value numberValue(const LoopTagField& field, std::string_view key, std::string_view text)
{
    const auto number = numberOf(field, spaceless(text));
    if (!number || *number < field.least || *number > field.most)
        refuseValue(key, text, expectedOf(field));
    return *number;
}

Value transientsValue(std::string_view text)
{
    std::map<std::int64_t, std::int64_t> types;
    for (const std::string& member : members(text)) {
        const std::string_view part = member;
        const std::size_t colon = std::min(part.find(':'), part.size());
        const auto frame = integer(part.substr(0, colon));
        const auto type = colon < part.size() ? integer(part.substr(colon + 1)) : 1;
        if (!frame || *frame < 0 || !type || *type < INT16_MIN || *type > UINT16_MAX)
            refuseValue("transients", part, "sample frames such as 0,11025,22050, or FRAME:TYPE,");
        types[*frame] = *type;
    }
    platform::Array transients;
    for (const auto& [frame, type] : types)
        if (type == 1)
            transients.emplace_back(frame);
        else
            transients.emplace_back(platform::Array{Value(frame), Value(type)});
    return transients;
}

Value fieldValue(const LoopTagField& field, std::string_view key, std::string_view text)
{
    if (spaceless(text).empty())
        return {};
    switch (field.kind) {
    case Kind::number:
        return numberValue(field, key, text);
    case Kind::list: {
        const std::set<std::string> each = members(text);
        return platform::Array(each.begin(), each.end());
    }
    case Kind::transients:
        return transientsValue(text);
    case Kind::text:
        break;
    }
    return meantText(text);
}

bool isWord(std::string_view key, std::string_view word)
{
    const auto fields = loopTagFieldsForKey(word);
    return !fields.empty() && loopTagFieldsForKey(key) == fields;
}

std::string knownKeys()
{
    std::string keys;
    for (const LoopTagField& field : loopTagFields())
        (keys += field.name) += ", ";
    return keys + "key, mode, signature; and beats, category, subCategory, kind";
}

std::string suggestion(std::string_view key)
{
    std::vector<std::string_view> words{"key", "signature", "tempo"};
    for (const LoopTagField& field : loopTagFields())
        words.insert(words.end(), {field.name, field.word});
    return didYouMean(key, words);
}

// Refuses names that `tags` shows but that cannot be set.
void refuseShown(std::string_view key, std::string_view text)
{
    if (equalIgnoringASCIICase(key, "tempo") || equalIgnoringASCIICase(key, "bpm"))
        refuse(fmt::format("{}={}: the tempo follows from beats, length and sample rate; set beats=N instead, where N "
                           "is the tempo times the seconds of the sound, by 60",
                           key, printable(text)));
    for (const std::string_view shown : {"chunks", "loops", "markers"})
        if (equalIgnoringASCIICase(key, shown))
            refuse(fmt::format("{} cannot be set; tags copy carries what belongs to a loop to another file", shown));
}

// Splits a key into its fields: a note with or without a mode, or only a mode.
std::vector<LoopTagAssignment> keyParts(std::string_view text, const std::vector<const LoopTagField*>& fields)
{
    const LoopTagField& root = *fields[0];
    const LoopTagField& mode = *fields[1];
    if (const auto alone = numberOfWord(mode, text); alone && text != "m")
        return {{&mode, *alone}};
    for (std::size_t end = text.size(); end > 0; --end) { // the longest note first: "Bb" is not "B"
        const auto note = numberOf(root, text.substr(0, end));
        const std::string_view behind = spaceless(text.substr(end));
        const auto type = numberOf(mode, behind);
        if (!note || *note < root.least || *note > root.most || (!behind.empty() && !type) ||
            (type && (*type < mode.least || *type > mode.most)))
            continue;
        std::vector<LoopTagAssignment> parts{{&root, *note}};
        if (type)
            parts.push_back({&mode, *type});
        return parts;
    }
    refuseValue("key", text, "a note such as C, F# or Bb, with minor or major behind it or without,");
}

std::vector<LoopTagAssignment> signatureParts(std::string_view text, const std::vector<const LoopTagField*>& fields)
{
    const std::size_t slash = text.find('/');
    if (slash == std::string_view::npos || slash == 0 || slash + 1 == text.size() ||
        text.find('/', slash + 1) != std::string_view::npos)
        refuseValue("signature", text, "a signature such as 4/4");
    return {{fields[0], numberValue(*fields[0], "signature", text.substr(0, slash))},
            {fields[1], numberValue(*fields[1], "signature", text.substr(slash + 1))}};
}

std::vector<LoopTagAssignment> assignmentsOf(std::string_view key, std::string_view text)
{
    const auto fields = loopTagFieldsForKey(key);
    if (fields.empty())
        refuseShown(key, text);
    if (fields.empty())
        refuse(fmt::format("there is no tag \"{}\" (a file of that name is \"./{}={}\"){}; tags are {}", printable(key),
                           printable(key), printable(text), suggestion(key), knownKeys()));
    std::vector<LoopTagAssignment> parts;
    if (!spaceless(text).empty() && isWord(key, "key")) {
        parts = keyParts(spaceless(text), fields);
    } else if (!spaceless(text).empty() && isWord(key, "signature")) {
        parts = signatureParts(spaceless(text), fields);
    } else {
        for (const LoopTagField* field : fields)
            parts.push_back({field, fieldValue(*field, key, text)});
    }
    return parts;
}

bool holdsUTF8(const Value& value)
{
    const auto* text = value.get<std::string>();
    const auto* list = value.get<platform::Array>();
    return (text == nullptr || platform::String::fromUTF8(*text)) &&
           (list == nullptr || std::ranges::all_of(*list, holdsUTF8));
}

// Whether two notes name the same key: "C" stands for 48, and 60 specifies the octave.
bool isSameNote(const LoopTagAssignment& a, const LoopTagAssignment& b)
{
    const auto* const first = a.value.get<std::int64_t>();
    const auto* const second = b.value.get<std::int64_t>();
    return a.field->name == std::string_view("midiRootNote") && first != nullptr && second != nullptr && *first > 0 &&
           *second > 0 && (*first - *second) % 12 == 0;
}

// JSON has a key both in words and in numbers, so both may be given.
void assign(std::vector<LoopTagAssignment>& assignments, std::string_view key, std::string_view text)
{
    for (LoopTagAssignment& part : assignmentsOf(key, text)) {
        if (!holdsUTF8(part.value))
            refuse(fmt::format("the value of {} is not valid UTF-8", key));
        const auto earlier = std::ranges::find(assignments, part.field, &LoopTagAssignment::field);
        if (earlier == assignments.end())
            assignments.push_back(std::move(part));
        else if (isSameNote(*earlier, part))
            earlier->value = isWord(key, "key") ? earlier->value : part.value;
        else if (earlier->value != part.value)
            refuse(fmt::format("{} is set twice, to different values", part.field->name));
    }
}

} // namespace

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
        const auto fields = loopTagFieldsForKey(argument);
        struct stat status = {};
        // A misspelt key must not pass for a missing file: without keys, all tags of the other files would be removed.
        if (fields.empty() && argument.find('/') == std::string::npos &&
            ::lstat(nameMeantBy(argument).c_str(), &status) != 0)
            refuse(fmt::format("\"{}\" is neither a file nor a tag{}; tags are {}", printable(argument),
                               suggestion(argument), knownKeys()));
        if (fields.empty())
            parsed.files.push_back(argument);
        for (const LoopTagField* field : fields)
            if (std::ranges::find(parsed.assignments, field, &LoopTagAssignment::field) == parsed.assignments.end())
                parsed.assignments.push_back({field, {}});
    }
    return parsed;
}
