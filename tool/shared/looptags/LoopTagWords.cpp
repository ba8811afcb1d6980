#include "tool/shared/looptags/LoopTagWords.h"

#include "loops/VireoLoopTerms.h"
#include "loops/tags/LoopTagFields.h"
#include "media/containers/ContainerHeaders.h"
#include "platform/core/JsonWriter.h"
#include "tool/shared/arguments/QuotedText.h"
#include "tool/shared/output/Output.h"

#include <algorithm>
#include <cmath>

namespace {

// "C" to "B" for MIDI notes 48 to 59, the number for others.
std::string noteName(std::int64_t note)
{
    const std::string_view name = VireoLoopNoteName(note);
    return name.empty() ? std::to_string(note) : std::string(name);
}

// "minor", "major" and others; empty for 0, the number for one without a name.
std::string modeName(std::int64_t keyType)
{
    constexpr std::int64_t none = 0, neither = 3, both = 4;
    if (keyType == none)
        return "";
    if (keyType == neither)
        return "neither major nor minor";
    if (keyType == both)
        return "major and minor";
    const std::string_view name = VireoLoopModeName(keyType);
    return name.empty() ? std::to_string(keyType) : std::string(name);
}

std::string keyText(const LoopTags& tags)
{
    const std::int64_t note = tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    const std::string mode = modeName(tags.number(VireoLoopCombinedTagsChunkDataKeyType));
    if (note == 0)
        return mode;
    return noteName(note) + (mode.empty() ? "" : " " + mode);
}

// Notes in different octaves have the same name, so the note number follows.
std::string keyInWords(const LoopTags& tags)
{
    const std::string words = keyWords(tags);
    return words == keyText(tags)
               ? words
               : fmt::format("{} (note {})", words, tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey));
}

std::string numberText(std::int64_t number)
{
    return number == 0 ? "" : std::to_string(number);
}

// One part of a signature without the other.
template <const char* const& part>
std::string aloneText(const LoopTags& tags)
{
    return loopSignature(tags).empty() ? numberText(tags.number(part)) : "";
}

std::string descriptorsText(const LoopTags& tags)
{
    std::string joined;
    if (const auto* list = platform::find<platform::Array>(tags.combined, VireoLoopCombinedTagsChunkDataDescriptorsKey))
        for (const platform::Value& value : *list)
            if (const auto* text = value.get<std::string>())
                joined += (joined.empty() ? "" : ", ") + quotedText(*text, ",");
    return joined;
}

std::string chunksText(const LoopTags& tags)
{
    std::string text;
    for (const LoopTags::Chunk& chunk : tags.chunks)
        text += fmt::format("{}{} ({} bytes)", text.empty() ? "" : ", ", chunk.id, chunk.size);
    return text;
}

std::string tempoText(const LoopTags& tags)
{
    const double tempo = tags.tempo();
    return tempo > 0 ? fmt::format("{:.10g}", std::round(tempo * 100) / 100) : "";
}

std::string kindText(const LoopTags& tags)
{
    const std::int64_t type = tags.number(VireoLoopCombinedTagsChunkDataFileTypeKey);
    return type == 1 ? "loop" : type == 2 ? "not a loop" : numberText(type);
}

// Frames, each with its type unless it is the usual one.
std::string transientsText(const LoopTags& tags)
{
    std::string text;
    for (const VireoLoopTransient& transient : tags.transients) {
        text += fmt::format("{}{}", text.empty() ? "" : ",", transient.frame());
        if (transient.transientType() != 1)
            text += fmt::format(":{}", transient.transientType());
    }
    return text;
}

// "0-44099,50000-60000".
std::string loopsText(const LoopTags& tags)
{
    std::string text;
    for (const SamplerTags::Loop& loop : tags.sampler.loops)
        text += fmt::format("{}{}-{}", text.empty() ? "" : ",", loop.firstFrame, loop.lastFrame);
    return text;
}

// "frames 0 to 44099, alternating" of one, the number of several.
std::string loopsInWords(const LoopTags& tags)
{
    const auto& loops = tags.sampler.loops;
    if (loops.size() != 1)
        return numberText(std::ssize(loops));
    const SamplerTags::Loop& loop = loops.front();
    return fmt::format("frames {} to {}{}{}", loop.firstFrame, loop.lastFrame,
                       loop.kind == SamplerTags::Loop::Kind::forward ? "" : ", ",
                       loop.kind == SamplerTags::Loop::Kind::forward ? "" : loopKindName(loop.kind));
}

// Frames, each with its name.
std::string markersText(const LoopTags& tags)
{
    std::string text;
    for (const SamplerTags::Marker& marker : tags.sampler.markers)
        text += fmt::format("{}{}{}{}", text.empty() ? "" : ", ", marker.frame, marker.name.empty() ? "" : " ",
                            quotedText(marker.name, ","));
    return text;
}

template <const char* const& key>
std::string text(const LoopTags& tags)
{
    return quotedText(tags.text(key));
}

// The tags shown for a loop, in order.
struct ShownTag {
    const char* name;
    const char* label;
    TagText text;
    TagText brief = nullptr; // null: the same text
};
const ShownTag kShownTags[] = {
    {"tempo", "Tempo", tempoText},
    {"beatCount", "Beats",
     [](const LoopTags& tags) { return numberText(tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey)); }},
    {"key", "Key", keyText, keyInWords},
    {"signature", "Signature", loopSignature},
    {"signatureTop", "signatureTop", aloneText<VireoLoopCombinedTagsChunkDataSignatureTopKey>},
    {"signatureBottom", "signatureBottom", aloneText<VireoLoopCombinedTagsChunkDataSignatureBottomKey>},
    {"loopFileType", "Kind", kindText},
    {"instrumentType", "Category", text<VireoLoopCombinedTagsChunkDataInstrumentTypeKey>},
    {"instrumentSubType", "Sub-category", text<VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey>},
    {"genre", "Genre", text<VireoLoopCombinedTagsChunkDataGenreKey>},
    {"descriptors", "Descriptors", descriptorsText},
    {"title", "Title", text<VireoLoopFileInfoChunkDataTitleKey>},
    {"artist", "Artist", text<VireoLoopFileInfoChunkDataArtistKey>},
    {"copyright", "Copyright", text<VireoLoopFileInfoChunkDataCopyrightKey>},
    {"comments", "Comments", text<VireoLoopFileInfoChunkDataCommentsKey>},
    {"transients", "Transients", transientsText,
     [](const LoopTags& tags) { return numberText(std::ssize(tags.transients)); }},
    {"loops", "Loop points", loopsText, loopsInWords},
    {"markers", "Markers", markersText,
     [](const LoopTags& tags) { return numberText(std::ssize(tags.sampler.markers)); }},
    {"chunks", "Chunks", chunksText},
};

void writeSamplerLists(JsonWriter& json, const SamplerTags& sampler)
{
    if (!sampler.loops.empty()) {
        json.key("loops").beginArray();
        for (const SamplerTags::Loop& loop : sampler.loops) {
            json.beginObject().member("firstFrame", loop.firstFrame).member("lastFrame", loop.lastFrame);
            json.member("kind", loopKindName(loop.kind));
            if (loop.playCount > 0)
                json.member("playCount", loop.playCount);
            json.member("source", fourCCText(loop.source)).endObject();
        }
        json.endArray();
    }
    if (!sampler.markers.empty()) {
        json.key("markers").beginArray();
        for (const SamplerTags::Marker& marker : sampler.markers) {
            json.beginObject().member("frame", marker.frame);
            if (marker.frames > 0)
                json.member("frames", marker.frames);
            if (!marker.name.empty())
                json.member("name", marker.name);
            json.member("source", fourCCText(marker.source)).endObject();
        }
        json.endArray();
    }
}

// For tags combined from several values, the source of the first. Loop chunks are not named, because they are the rule
// in AIFF and CAF files.
std::string sourceOf(const LoopTags& tags, std::string_view name)
{
    std::string source;
    const auto found = tags.sources.find(name == "key" ? "midiRootNote" : name == "signature" ? "signatureTop" : name);
    if (name == "loops" && !tags.sampler.loops.empty())
        source = fourCCText(tags.sampler.loops.front().source);
    else if (name == "markers" && !tags.sampler.markers.empty())
        source = fourCCText(tags.sampler.markers.front().source);
    else if (found != tags.sources.end())
        source = found->second;
    const bool holdsLoopChunks = tags.fileType == kAIFF || tags.fileType == kCaff;
    const std::string shown = source.substr(0, source.find_last_not_of(' ') + 1);
    return holdsLoopChunks && source != "INST" && source != "MARK" ? "" : shown;
}

} // namespace

std::string keyWords(const LoopTags& tags)
{
    const std::int64_t note = tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    const std::string name = loopKeyName(note), text = keyText(tags);
    return name.empty() ? text : name + text.substr(noteName(note).size());
}

std::vector<TagLine> tagLines(const LoopTags& tags)
{
    std::vector<TagLine> lines;
    for (const ShownTag& shown : kShownTags)
        if (std::string text = shown.text(tags); !text.empty())
            lines.push_back({shown.name, shown.label, text, shown.brief != nullptr ? shown.brief(tags) : text,
                             sourceOf(tags, shown.name)});
    return lines;
}

TagText tagTextCalled(std::string_view name)
{
    return std::ranges::find_if(kShownTags, [&](const ShownTag& each) { return each.name == name; })->text;
}

void writeLoopTags(JsonWriter& json, const std::string& path, const LoopTags& tags)
{
    json.beginObject().member("path", path);
    writeLoopTagMembers(json, tags);
    json.endObject();
}

void writeLoopTagMembers(JsonWriter& json, const LoopTags& tags)
{
    for (const LoopTagValue& tag : loopTagRecord(tags))
        json.member(tag.name, tag.value);
    if (!tags.chunks.empty()) {
        json.key("chunks").beginArray();
        for (const LoopTags::Chunk& chunk : tags.chunks)
            json.beginObject().member("id", chunk.id).member("size", chunk.size).endObject();
        json.endArray();
    }
    if (const auto sources = loopTagSources(tags); !sources.empty()) {
        json.key("sources").beginObject();
        for (const auto& [name, chunk] : sources)
            json.member(name, chunk);
        json.endObject();
    }
    writeSamplerLists(json, tags.sampler);
    if (!tags.transients.empty()) { // there may be millions
        json.key("transients").beginArray();
        for (const VireoLoopTransient& transient : tags.transients)
            json.beginObject().member("type", transient.transientType()).member("frame", transient.frame()).endObject();
        json.endArray();
    }
}
