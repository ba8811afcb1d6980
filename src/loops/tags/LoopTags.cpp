#include "loops/tags/LoopTags.h"

#include "loops/VireoLoopTerms.h"
#include "loops/tags/LoopTagFields.h"
#include "media/containers/ContainerHeaders.h"

#include <algorithm>
#include <cmath>

std::map<std::string, std::string, std::less<>> loopTagSources(const LoopTags& tags)
{
    constexpr std::string_view inCategories[] = {"instrumentType", "instrumentSubType", "genre", "descriptors"};
    constexpr std::pair<std::string_view, const char*> texts[] = {
        {"title", "NAME"}, {"artist", "AUTH"}, {"copyright", "(c) "}, {"comments", "COMT"}};
    const bool isAIFF = tags.fileType == kAIFF;
    auto sources = tags.sources;
    for (const LoopTagValue& tag : loopTagValues(tags)) {
        const auto* const text = std::ranges::find(texts, tag.name, [](const auto& each) { return each.first; });
        const bool isInCategories = std::ranges::find(inCategories, tag.name) != std::end(inCategories);
        const char* source = isAIFF && isInCategories ? "cate" : "basc";
        if (text != std::end(texts))
            source = isAIFF ? text->second : "info";
        sources.try_emplace(tag.name, source);
    }
    if (!tags.transients.empty())
        sources.emplace("transients", "trns");
    return sources;
}

std::int64_t LoopTags::number(std::string_view key) const
{
    const auto* number = platform::find<std::int64_t>(combined, key);
    return number != nullptr ? *number : 0;
}

std::string LoopTags::text(std::string_view key) const
{
    const auto* text = platform::find<std::string>(combined, key);
    if (text == nullptr)
        text = platform::find<std::string>(info, key);
    return text != nullptr ? *text : std::string();
}

double LoopTags::tempo() const
{
    if (statedTempo > 0)
        return statedTempo;
    return VireoLoopTempo(number(VireoLoopCombinedTagsChunkDataBeatCountKey), frames, sampleRate);
}

std::string loopContainerName(FourCC fileType)
{
    switch (fileType) {
    case kCaff:
        return "CAF";
    case fourCC("RIFX"): // big-endian
        return "WAVE";
    case fourCC("W64f"):
        return "Wave64";
    default:
        return fourCCText(fileType);
    }
}

std::string loopSignature(const LoopTags& tags)
{
    const std::int64_t top = tags.number(VireoLoopCombinedTagsChunkDataSignatureTopKey);
    const std::int64_t bottom = tags.number(VireoLoopCombinedTagsChunkDataSignatureBottomKey);
    return top == 0 || bottom == 0 ? "" : std::to_string(top) + '/' + std::to_string(bottom);
}

const char* loopKindName(SamplerTags::Loop::Kind kind)
{
    constexpr const char* names[] = {"forward", "alternating", "backward", "other"};
    return names[static_cast<std::size_t>(kind)];
}

bool isAbsentLoopTag(const platform::Value& value)
{
    if (const auto* number = value.get<std::int64_t>())
        return *number == 0;
    if (const auto* number = value.get<double>())
        return *number == 0;
    if (const auto* text = value.get<std::string>())
        return text->empty();
    const auto* list = value.get<platform::Array>();
    return list == nullptr || std::all_of(list->begin(), list->end(), isAbsentLoopTag);
}

std::vector<LoopTagValue> loopTagValues(const LoopTags& tags)
{
    std::vector<LoopTagValue> present;
    for (const LoopTagField& field : loopTagFields()) {
        const platform::Dictionary& values = field.isFileInfo ? tags.info : tags.combined;
        const auto found = field.key != nullptr ? values.find(field.key) : values.end();
        if (found != values.end() && !isAbsentLoopTag(found->second))
            present.push_back({field.name, found->second});
    }
    if (const double tempo = tags.tempo(); tempo > 0)
        present.push_back({"tempo", tempo});
    return present;
}

std::vector<LoopTagValue> loopTagRecord(const LoopTags& tags)
{
    std::vector<LoopTagValue> record{{"fileType", fourCCText(tags.fileType)},
                                     {"containerName", loopContainerName(tags.fileType)}};
    if (tags.sampleRate > 0) {
        record.push_back({"sampleRate", std::llround(tags.sampleRate)});
        record.push_back({"frames", tags.frames});
        record.push_back({"durationSeconds", static_cast<double>(tags.frames) / tags.sampleRate});
    }
    for (LoopTagValue& tag : loopTagValues(tags)) {
        const auto* const number = tag.value.get<std::int64_t>();
        const std::string note = tag.name == "midiRootNote" && number ? loopKeyName(*number) : "";
        const std::string_view mode = tag.name == "keyType" && number ? VireoLoopModeName(*number) : "";
        const bool endsSignature = tag.name == "signatureBottom" && !loopSignature(tags).empty();
        record.push_back(std::move(tag));
        if (!note.empty())
            record.push_back({"key", note});
        if (!mode.empty())
            record.push_back({"mode", std::string(mode)});
        if (endsSignature)
            record.push_back({"signature", loopSignature(tags)});
    }
    return record;
}
