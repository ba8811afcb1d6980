// The CAF side of LoopTagsPatch.
#include "audiofile/metadata/CAFTextPairs.h"
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopTerms.h"
#include "loops/tags/bytes/LoopTagsLayouts.h"
#include "media/containers/ContainerHeaders.h"

using platform::Value;

using namespace loopkeys;

namespace {

constexpr FourCC kInfo = fourCC("info");
constexpr std::string_view kDescriptors = VireoLoopCombinedTagsChunkDataDescriptorsKey;

// The pair that holds the field; both parts of a signature share one. Null for the file type, which has none.
const char* cafKeyOf(const LoopTagField& field)
{
    static constexpr std::pair<std::string_view, const char*> keys[] = {
        {kBeatCount, "beat count"},
        {kTop, "time signature"},
        {kBottom, "time signature"},
        {kRootNote, "key signature"},
        {kKeyType, "key type"},
        {VireoLoopCombinedTagsChunkDataInstrumentTypeKey, "category"},
        {VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, "subcategory"},
        {VireoLoopCombinedTagsChunkDataGenreKey, "genre"},
        {kDescriptors, "descriptors"},
    };
    if (field.isFileInfo)
        return field.name; // pairs have the same names
    for (const auto& [key, name] : keys)
        if (field.key != nullptr && key == field.key)
            return name;
    return nullptr;
}

// The text that stands for a value; empty if there is none.
std::string cafText(const LoopTagField& field, const Value& value)
{
    const std::int64_t number = assignedLoopNumber(value);
    if (field.kind == LoopTagField::Kind::text)
        return assignedLoopText(value);
    if (field.kind == LoopTagField::Kind::list) {
        std::string joined;
        for (bool isFirst = true; const std::string& each : assignedLoopTexts(value)) {
            joined += (isFirst ? "" : ",") + each;
            isFirst = false;
        }
        return joined;
    }
    if (field.key == kBeatCount)
        return number > 0 ? std::to_string(number) : "";
    if (field.key == kRootNote)
        return std::string(VireoLoopNoteName(number));
    return std::string(number > 0 ? VireoLoopModeName(number) : "");
}

// Changes nothing if the library reads the requested value already; texts are compared byte by byte.
void assignPair(CAFTextPairs& pairs, const platform::Dictionary& read, const LoopTagField& field, const Value& value)
{
    const std::string text = cafText(field, value);
    const auto there = read.find(field.key);
    const bool isText = field.kind == LoopTagField::Kind::text;
    if (text.empty())
        pairs.erase(cafKeyOf(field));
    else if (isText || there == read.end() || there->second != value)
        pairs.set(cafKeyOf(field), text);
}

void assignSignature(CAFTextPairs& pairs, const platform::Dictionary& read,
                     std::span<const LoopTagAssignment> assignments)
{
    std::int64_t parts[] = {0, 0};
    const std::string_view keys[] = {kTop, kBottom};
    bool isNamed = false, differs = false;
    for (std::size_t i = 0; i < 2; ++i) {
        const auto* there = platform::find<std::int64_t>(read, keys[i]);
        parts[i] = there != nullptr ? *there : 0;
        for (const LoopTagAssignment& assignment : assignments)
            if (assignment.field->key != nullptr && assignment.field->key == keys[i]) {
                isNamed = true;
                differs = differs || assignedLoopNumber(assignment.value) != parts[i];
                parts[i] = assignedLoopNumber(assignment.value);
            }
    }
    if (isNamed && (parts[0] < 1 || parts[1] < 1))
        pairs.erase("time signature");
    else if (differs)
        pairs.set("time signature", std::to_string(parts[0]) + '/' + std::to_string(parts[1]));
}

CAFTextPairs pairsOf(const std::optional<Bytes>& payload)
{
    return payload ? CAFTextPairs(*payload) : CAFTextPairs();
}

std::optional<Bytes> infoOf(const RawLoopTags& tags)
{
    const auto found = tags.texts.find(kInfo);
    return found == tags.texts.end() ? std::nullopt : std::optional(found->second);
}

CAFTextPairs pairsWith(const RawLoopTags& tags, const LoopTagField& field)
{
    return pairsOf(field.isFileInfo ? infoOf(tags) : tags.basic);
}

void storePairs(RawLoopTags& tags, bool isFileInfo, const CAFTextPairs& pairs)
{
    if (pairs.isEmpty() && isFileInfo)
        tags.texts.erase(kInfo);
    else if (pairs.isEmpty())
        tags.basic.reset();
    else
        (isFileInfo ? tags.texts[kInfo] : tags.basic.emplace()) = pairs.payload();
}

} // namespace

void assignCAFLoopTags(RawLoopTags& tags, std::span<const LoopTagAssignment> assignments)
{
    const platform::Dictionary read = combinedLoopTagsOf(tags);
    CAFTextPairs basic = pairsOf(tags.basic), info = pairsOf(infoOf(tags));
    const CAFTextPairs basicBefore = basic, infoBefore = info;
    assignSignature(basic, read, assignments);
    for (const auto& [field, value] : assignments)
        if (cafKeyOf(*field) != nullptr && field->key != kTop && field->key != kBottom)
            assignPair(field->isFileInfo ? info : basic, read, *field, value);
    if (basic != basicBefore)
        storePairs(tags, false, basic);
    if (info != infoBefore)
        storePairs(tags, true, info);
}

std::optional<std::string> loopPairText(const RawLoopTags& tags, const LoopTagField& field)
{
    const char* const key = tags.fileType != kAIFF ? cafKeyOf(field) : nullptr;
    const CAFTextPairs pairs = key != nullptr ? pairsWith(tags, field) : CAFTextPairs();
    const std::string* text = key != nullptr ? pairs.find(key) : nullptr;
    return text != nullptr && !text->empty() ? std::optional(*text) : std::nullopt;
}

bool copyLoopPair(RawLoopTags& to, const RawLoopTags& from, const LoopTagField& field)
{
    const auto text = loopPairText(from, field);
    if (!text)
        return false;
    CAFTextPairs pairs = pairsWith(to, field);
    pairs.set(cafKeyOf(field), *text);
    if (pairs != pairsWith(to, field))
        storePairs(to, field.isFileInfo, pairs);
    return true;
}
