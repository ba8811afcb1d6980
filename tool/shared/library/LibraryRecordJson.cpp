#include "tool/shared/library/LibraryRecordJson.h"

#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/LibraryRecordCheck.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
#include <cmath>
#include <map>
#include <set>
#include <utility>
#include <vector>

namespace {

using JsonTree = nlohmann::json;
using KnownWhole = LibraryRecord::Whole;
using KnownReal = LibraryRecord::Real;
using KnownText = LibraryRecord::Text;

constexpr std::pair<const char*, std::int64_t SeenStamp::*> kStampKeys[] = {{"size", &SeenStamp::size},
                                                                            {"modified", &SeenStamp::modified},
                                                                            {"changed", &SeenStamp::changed},
                                                                            {"inode", &SeenStamp::inode}};

// In JSON it is true or false, as other verbs write it.
bool isTruth(KnownWhole LibraryRecord::*member)
{
    return member == &LibraryRecord::floatingPoint;
}

// The same of texts with ", " between them, which are arrays.
bool isList(KnownText LibraryRecord::*member)
{
    return member == &LibraryRecord::descriptors;
}

constexpr std::string_view kBetweenWords = ", ";

std::vector<std::string> listOf(std::string_view text)
{
    std::vector<std::string> words;
    for (std::size_t end = text.find(kBetweenWords); end != text.npos; end = text.find(kBetweenWords)) {
        words.emplace_back(text.substr(0, end));
        text.remove_prefix(end + kBetweenWords.size());
    }
    words.emplace_back(text);
    return words;
}

// Rates are whole numbers but for a few files; 44100.0 would be another number to some readers.
bool isWritableWhole(double value)
{
    constexpr double most = 9'007'199'254'740'992.0; // 2^53
    return std::fabs(value) < most && value == std::trunc(value) && !(value == 0 && std::signbit(value));
}

struct MemberWriter {
    JsonWriter& json;
    const LibraryRecord& record;
    const char* key;

    void operator()(KnownText LibraryRecord::*member) const
    {
        if (const KnownText& text = record.*member; !text.empty() && isList(member))
            json.member(std::string(key), listOf(text));
        else
            json.knownMember(std::string(key), text);
    }
    void operator()(KnownWhole LibraryRecord::*member) const
    {
        if (const KnownWhole& number = record.*member; number && isTruth(member))
            json.member(std::string(key), *number != 0);
        else
            json.knownMember(std::string(key), number);
    }
    void operator()(KnownReal LibraryRecord::*member) const
    {
        const KnownReal& number = record.*member;
        if (!number || !std::isfinite(*number))
            return;
        if (isWritableWhole(*number))
            json.member(std::string(key), static_cast<std::int64_t>(*number));
        else
            json.member(std::string(key), *number);
    }
};

Bytes pointBytes(const std::string& text)
{
    Bytes bytes(text.size());
    std::transform(text.begin(), text.end(), bytes.begin(), [](char byte) { return static_cast<std::byte>(byte); });
    return bytes;
}

// RFC 4648, with its padding, and with nothing else in it.
std::string fromBase64(std::string_view text)
{
    static const auto values = [] {
        std::array<signed char, 256> table{};
        table.fill(-1);
        constexpr std::string_view digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
        for (std::size_t i = 0; i < digits.size(); ++i)
            table[static_cast<unsigned char>(digits[i])] = static_cast<signed char>(i);
        return table;
    }();
    const std::size_t padding = text.ends_with("==") ? 2 : text.ends_with('=') ? 1 : 0;
    if (text.size() % 4 != 0)
        throw Failure("points are no base64");
    std::string bytes;
    bytes.reserve(text.size() / 4 * 3);
    std::uint32_t group = 0;
    int digits = 0;
    for (const char character : text.substr(0, text.size() - padding)) {
        const signed char value = values[static_cast<unsigned char>(character)];
        if (value < 0)
            throw Failure("points are no base64");
        group = group << 6 | static_cast<std::uint32_t>(value);
        if (++digits == 4) {
            for (const int shift : {16, 8, 0})
                bytes += static_cast<char>(group >> shift & 0xff);
            group = 0;
            digits = 0;
        }
    }
    if (digits == 3) {
        bytes += static_cast<char>(group >> 10 & 0xff);
        bytes += static_cast<char>(group >> 2 & 0xff);
    } else if (digits == 2) {
        bytes += static_cast<char>(group >> 4 & 0xff);
    }
    return bytes;
}

std::size_t endOfString(std::string_view json, std::size_t quote)
{
    std::size_t at = quote + 1;
    while (json[at] != '"')
        at += json[at] == '\\' ? 2U : 1U;
    return at + 1;
}

std::string_view withoutBlanks(std::string_view text)
{
    constexpr std::string_view blanks = " \t\r\n";
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    return text.substr(0, text.find_last_not_of(blanks) + 1);
}

/// The members of an object as they stand in its text, which must be valid.
std::vector<std::pair<std::string_view, std::string_view>> membersAsWritten(std::string_view json)
{
    std::vector<std::pair<std::string_view, std::string_view>> members;
    std::string_view key;
    std::size_t depth = 0, start = 0; // of a value; 0 ahead of a colon
    const auto endMember = [&](std::size_t end) {
        if (start != 0)
            members.emplace_back(key, withoutBlanks(json.substr(start, end - start)));
        start = 0;
    };
    for (std::size_t at = 0; at < json.size(); ++at) {
        const char character = json[at];
        if (character == '"') {
            const std::size_t end = endOfString(json, at);
            if (depth == 1 && start == 0)
                key = json.substr(at + 1, end - at - 2);
            at = end - 1;
        } else if (character == '{' || character == '[') {
            ++depth;
        } else if (character == '}' || character == ']') {
            if (--depth == 0)
                endMember(at);
        } else if (depth == 1 && character == ':' && start == 0) {
            start = at + 1;
        } else if (depth == 1 && character == ',') {
            endMember(at);
        }
    }
    return members;
}

/// JsonMembers of an object, each of which must be taken once.
class JsonMembers {
public:
    explicit JsonMembers(std::string_view text) : json_(JsonTree::parse(text, nullptr, false))
    {
        // The parser takes a zero byte for the end, and has not looked at what follows.
        if (!json_.is_object() || text.find('\0') != text.npos)
            throw Failure("is no JSON object");
        for (const auto& [key, value] : membersAsWritten(text))
            if (!json_.contains(key) || !written_.emplace(std::string(key), value).second)
                throw Failure("a key comes twice, or is not written as it is");
    }
    /// The value of a key; null for none.
    const JsonTree* take(const char* key)
    {
        const auto found = json_.find(key);
        if (found == json_.end())
            return nullptr;
        taken_.insert(key);
        return &*found;
    }
    /// The same, which must be there.
    const JsonTree& need(const char* key)
    {
        const JsonTree* const value = take(key);
        if (value == nullptr)
            throw Failure(fmt::format("has no {}", key));
        return *value;
    }
    /// The text of the value, character by character.
    std::string_view asWritten(const char* key) const { return written_.at(key); }
    bool has(const char* key) const { return json_.contains(key); }
    void requireNoOther() const
    {
        for (const auto& [key, value] : written_)
            if (!taken_.contains(key))
                throw Failure(fmt::format("{} is no key of a record", key));
    }

private:
    JsonTree json_;
    std::map<std::string, std::string_view> written_;
    std::set<std::string> taken_;
};

[[noreturn]] void failForType(const char* key)
{
    throw Failure(fmt::format("{} is of another type", key));
}

std::string textFrom(const JsonTree& value, const char* key)
{
    return value.is_string() ? value.get<std::string>() : (failForType(key), "");
}

std::int64_t wholeFrom(const JsonTree& value, const char* key)
{
    if (!value.is_number_integer())
        failForType(key);
    if (value.is_number_unsigned() && !std::in_range<std::int64_t>(value.get<std::uint64_t>()))
        throw Failure(fmt::format("{} is too large", key));
    return value.get<std::int64_t>();
}

KnownText textOfList(const JsonTree& values, const char* key)
{
    if (!values.is_array())
        failForType(key);
    KnownText text;
    for (bool isFirst = true; const JsonTree& value : values) {
        const std::string word = textFrom(value, key);
        if (word.find(kBetweenWords) != word.npos)
            throw Failure(fmt::format("{} has two words in one", key));
        (text += std::exchange(isFirst, false) ? "" : kBetweenWords) += word;
    }
    return text;
}

struct MemberReader {
    LibraryRecord& record;
    const JsonTree& value;
    const char* key;

    void operator()(KnownText LibraryRecord::*member) const
    {
        record.*member = isList(member) ? textOfList(value, key) : textFrom(value, key);
    }
    void operator()(KnownWhole LibraryRecord::*member) const
    {
        if (!isTruth(member))
            record.*member = wholeFrom(value, key);
        else if (value.is_boolean())
            record.*member = value.get<bool>() ? 1 : 0;
        else
            failForType(key);
    }
    void operator()(KnownReal LibraryRecord::*member) const
    {
        if (!value.is_number())
            failForType(key);
        record.*member = value.get<double>();
    }
};

FilePlace placeFrom(const std::string& path)
{
    const std::size_t slash = path.rfind('/');
    if (slash == path.npos)
        throw Failure("the path is not absolute and plain");
    return {path.substr(0, slash + 1), path.substr(slash + 1)};
}

SeenStamp stampFrom(const JsonTree& value)
{
    if (!value.is_object() || value.size() != std::size(kStampKeys))
        failForType("stamp");
    SeenStamp stamp;
    for (const auto& [key, member] : kStampKeys) {
        if (!value.contains(key))
            failForType("stamp");
        stamp.*member = wholeFrom(value[key], key);
    }
    return stamp;
}

std::vector<LibraryProblem> problemsFrom(const JsonTree& values)
{
    if (!values.is_array())
        failForType("problems");
    std::vector<LibraryProblem> problems;
    for (const JsonTree& value : values) {
        if (!value.is_object() || value.size() != 2 || !value.contains("kind") || !value.contains("text"))
            failForType("problems");
        problems.push_back({textFrom(value["kind"], "kind"), textFrom(value["text"], "text")});
    }
    return problems;
}

LibraryOverview overviewFrom(const JsonTree& value)
{
    if (!value.is_object() || value.size() != 2 || !value.contains("framesPerPoint") || !value.contains("points") ||
        !value["points"].is_string())
        failForType("overview");
    return {wholeFrom(value["framesPerPoint"], "framesPerPoint"),
            fromBase64(value["points"].get_ref<const KnownText&>())};
}

void requireFields(const JsonTree& values)
{
    const auto isField = [](const JsonTree& value) {
        return value.is_object() && value.contains("name") && value["name"].is_string() && value.contains("value");
    };
    if (!values.is_array() || !std::all_of(values.begin(), values.end(), isField))
        failForType("fields");
}

LibraryRecord recordFrom(JsonMembers& members)
{
    LibraryRecord record;
    record.place = placeFrom(nameOfIndexed(textFrom(members.need("path"), "path")));
    record.stamp = stampFrom(members.need("stamp"));
    record.indexed = wholeFrom(members.need("indexed"), "indexed");
    for (const LibraryColumn& column : libraryColumns())
        if (const JsonTree* const value = members.take(column.key))
            std::visit(MemberReader{record, *value, column.key}, column.member);
    if (const JsonTree* const value = members.take("problems"))
        record.problems = problemsFrom(*value);
    if (const JsonTree* const value = members.take("overview"))
        record.overview = overviewFrom(*value);
    if (const JsonTree* const value = members.take("fields")) {
        requireFields(*value);
        record.fields = members.asWritten("fields");
    }
    if (const JsonTree* const value = members.take("loopTags")) {
        if (!value->is_object())
            failForType("loopTags");
        record.tags = members.asWritten("loopTags");
    }
    requireSound(record);
    return record;
}

LibraryRoot rootFrom(JsonMembers& members)
{
    LibraryRoot root{nameOfIndexed(textFrom(members.need("root"), "root")), {}};
    requireFolderPath(root.path);
    if (const JsonTree* const value = members.take("completed"))
        root.completed = wholeFrom(*value, "completed");
    return root;
}

} // namespace

void writeLibraryRecord(JsonWriter& json, const LibraryRecord& record)
{
    json.beginObject().member("path", indexedName(record.place.path())).key("stamp").beginObject();
    for (const auto& [key, member] : kStampKeys)
        json.member(std::string(key), record.stamp.*member);
    json.endObject().member("indexed", record.indexed);
    for (const LibraryColumn& column : libraryColumns())
        std::visit(MemberWriter{json, record, column.key}, column.member);
    if (!record.problems.empty()) {
        json.key("problems").beginArray();
        for (const LibraryProblem& problem : record.problems)
            json.beginObject().member("kind", problem.kind).member("text", problem.text).endObject();
        json.endArray();
    }
    if (record.overview) {
        json.key("overview").beginObject().member("framesPerPoint", record.overview->framesPerPoint);
        json.member("points", platform::Value(pointBytes(record.overview->points))).endObject();
    }
    if (!record.fields.empty())
        json.key("fields").writeJson(record.fields);
    if (!record.tags.empty())
        json.key("loopTags").writeJson(record.tags);
    json.endObject();
}

void writeLibraryRoot(JsonWriter& json, const LibraryRoot& root)
{
    json.beginObject().member("root", indexedName(root.path)).knownMember("completed", root.completed).endObject();
}

LibraryLine libraryLineOf(std::string_view json)
{
    JsonMembers members(json);
    LibraryLine line;
    if (members.has("root"))
        line = rootFrom(members);
    else if (members.has("error"))
        line = UnseenPlace{textFrom(members.need("path"), "path"), textFrom(members.need("error"), "error")};
    else
        line = recordFrom(members);
    members.requireNoOther();
    return line;
}
