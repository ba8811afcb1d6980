// The CAF side of the combined tags: pairs of texts.
#include "loops/VireoLoopCombinedTagsChunkDataTypes.h"
#include "loops/VireoLoopTerms.h"
#include "loops/tagging/CAFPayloads.h"
#include "loops/tagging/LoopTiming.h"
#include "platform/String.h"

#include <algorithm>
#include <set>

using platform::Dictionary;
using SearchInfo = VireoLoopCombinedTagsChunkDataTypes::SearchInfo;

namespace {

std::vector<std::string> split(std::string_view text, char separator)
{
    std::vector<std::string> parts;
    for (;;) {
        const std::size_t end = text.find(separator);
        parts.emplace_back(text.substr(0, end));
        if (end == std::string_view::npos)
            return parts;
        text.remove_prefix(end + 1);
    }
}

/// The first element under a key; null if there is none.
const std::string* firstOf(const SearchInfo& info, const char* key)
{
    const auto found = info.find(key);
    return found == info.end() ? nullptr : &found->second.front();
}

void addKey(const Dictionary& tags, tagging::StringPairs& strings)
{
    const std::string_view note = VireoLoopNoteName(
        VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataMidiRootNoteKey));
    if (note.empty())
        return;
    const std::int64_t type =
        VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataKeyType);
    const std::string_view mode = VireoLoopModeName(type);
    strings["key signature"] = note;
    strings["key type"] = type == 0 || mode.empty() ? "any" : mode;
}

void addTexts(const Dictionary& tags, tagging::StringPairs& strings)
{
    const std::pair<const char*, const char*> texts[] = {
        {"category", VireoLoopCombinedTagsChunkDataInstrumentTypeKey},
        {"subcategory", VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey},
        {"genre", VireoLoopCombinedTagsChunkDataGenreKey},
    };
    for (const auto& [name, key] : texts)
        if (const auto* text = platform::find<std::string>(tags, key))
            strings[name] = *text;
    const auto* descriptors = platform::find<platform::Array>(tags, VireoLoopCombinedTagsChunkDataDescriptorsKey);
    if (descriptors == nullptr)
        return;
    std::string joined, separator;
    for (const platform::Value& value : *descriptors)
        if (const auto* text = value.get<std::string>()) {
            joined += separator + *text;
            separator = ","; // precedes the next text, even if this one is empty
        }
    strings["descriptors"] = joined;
}

} // namespace

std::int64_t VireoLoopCombinedTagsChunkDataTypes::numberFor(const Dictionary& tags, const char* key)
{
    const auto* number = platform::find<std::int64_t>(tags, key);
    return number != nullptr ? *number : 0;
}

SearchInfo VireoLoopCombinedTagsChunkDataTypes::extractSearchInfoFromData(BytesView payload)
{
    SearchInfo info;
    tagging::ForEachCAFInfoString(payload, [&](std::string_view keyText, std::string_view valueText) {
        const platform::String key = platform::String::fromUTF8(keyText);
        const platform::String value = platform::String::fromUTF8(valueText);
        if (key && value)
            info[key.utf8()] = split(value.utf8(), ',');
    });
    return info;
}

std::int64_t VireoLoopCombinedTagsChunkDataTypes::rootNoteKeyFromCafDict(const SearchInfo& info)
{
    constexpr std::int64_t notes[] = {57, 59, 48, 50, 52, 53, 55}; // A to G
    const std::string* key = firstOf(info, "key signature");
    if (key == nullptr || key->empty() || key->front() < 'A' || key->front() > 'G')
        return 0;
    const char accidental = key->size() > 1 ? (*key)[1] : '\0';
    return notes[key->front() - 'A'] + (accidental == '#') - (accidental == 'b');
}

std::int64_t VireoLoopCombinedTagsChunkDataTypes::keyTypeFromCafDict(const SearchInfo& info)
{
    const std::string* name = firstOf(info, "key type");
    return name != nullptr ? VireoLoopModeNamed(*name).value_or(0) : 0;
}

Dictionary VireoLoopCombinedTagsChunkDataTypes::combinedTagsChunkDataDictionaryFromCafChunkData(BytesView payload)
{
    const SearchInfo info = extractSearchInfoFromData(payload);
    Dictionary tags;
    const auto takeText = [&](const char* name, const char* key) {
        if (const std::string* text = firstOf(info, name))
            tags[key] = *text;
    };
    takeText("category", VireoLoopCombinedTagsChunkDataInstrumentTypeKey);
    takeText("subcategory", VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey);
    takeText("genre", VireoLoopCombinedTagsChunkDataGenreKey);
    if (const auto found = info.find("descriptors"); found != info.end()) {
        const std::set<std::string> each(found->second.begin(), found->second.end());
        tags[VireoLoopCombinedTagsChunkDataDescriptorsKey] = platform::Array(each.begin(), each.end());
    }

    const std::string* beats = firstOf(info, "beat count");
    const std::int64_t beatCount = beats != nullptr ? tagging::LongNumberAtStartOf(*beats) : 0;
    const std::string* signature = firstOf(info, "time signature");
    const auto [top, bottom] = tagging::TimeSignatureIn(signature != nullptr ? *signature : "");
    tags[VireoLoopCombinedTagsChunkDataMidiRootNoteKey] = rootNoteKeyFromCafDict(info);
    tags[VireoLoopCombinedTagsChunkDataKeyType] = keyTypeFromCafDict(info);
    tags[VireoLoopCombinedTagsChunkDataBeatCountKey] = beatCount;
    tags[VireoLoopCombinedTagsChunkDataSignatureTopKey] = top;
    tags[VireoLoopCombinedTagsChunkDataSignatureBottomKey] = bottom;
    tags[VireoLoopCombinedTagsChunkDataFileTypeKey] = top != 0 && beatCount > 0 ? 1 : 2;
    return tags;
}

std::optional<Bytes>
VireoLoopCombinedTagsChunkDataTypes::cafChunkDataFromCombinedTagsChunkDataDictionary(const Dictionary& tags)
{
    tagging::StringPairs strings;
    const std::int64_t beatCount =
        VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataBeatCountKey);
    if (beatCount > 0)
        strings["beat count"] = std::to_string(beatCount);
    const std::int64_t top =
        VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataSignatureTopKey);
    const std::int64_t bottom =
        VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataSignatureBottomKey);
    if (VireoLoopCombinedTagsChunkDataTypes::numberFor(tags, VireoLoopCombinedTagsChunkDataFileTypeKey) == 1 &&
        top >= 1 && bottom >= 1)
        strings["time signature"] = std::to_string(top) + "/" + std::to_string(bottom);
    addKey(tags, strings);
    addTexts(tags, strings);
    return CAFInfoStringsData(strings);
}
