#include "tool/shared/indexing/LoopTagColumns.h"

#include "loops/VireoLoopTerms.h"
#include "platform/core/JsonWriter.h"
#include "tool/shared/indexing/BoundedText.h"
#include "tool/shared/library/KeyText.h"
#include "tool/shared/library/LibraryRecord.h"
#include "tool/shared/looptags/LoopTagWords.h"
#include "tool/shared/output/Record.h"

namespace {

constexpr std::size_t kMostOfTags = 1 << 18; // bytes of the JSON object

using TagSources = std::map<std::string, std::string, std::less<>>;

std::string tagSource(const TagSources& sources, std::string_view name)
{
    const auto found = sources.find(name);
    return found == sources.end() ? "" : boundedLine(found->second, kMostOfLine);
}

std::string joinedDescriptors(const LoopTags& tags)
{
    std::string joined;
    if (const auto* list = platform::find<platform::Array>(tags.combined, VireoLoopCombinedTagsChunkDataDescriptorsKey))
        for (const platform::Value& value : *list)
            if (const auto* text = value.get<std::string>(); text != nullptr && !text->empty())
                joined += (joined.empty() ? "" : ", ") + *text;
    return boundedLine(joined, kMostOfLine);
}

void addKey(LibraryRecord& record, const LoopTags& tags, const TagSources& sources)
{
    constexpr std::int64_t kNotes = 12, kMostNote = 127;
    const std::int64_t note = tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    const std::int64_t keyType = tags.number(VireoLoopCombinedTagsChunkDataKeyType);
    if (keyType > 0)
        record.mode = VireoLoopModeName(keyType);
    if (note < 1 || note > kMostNote)
        return;
    record.keyNote = note % kNotes;
    record.key = keyWords(tags);
    record.keySource = tagSource(sources, "midiRootNote");
}

std::string objectOf(const LoopTags& tags)
{
    JsonWriter json;
    json.beginObject();
    writeLoopTagMembers(json, tags);
    json.endObject();
    return std::string(json.text());
}

/// Shortens what has no bounds of its own, for files whose tags would make a row of megabytes.
void shortenTags(LoopTags& tags)
{
    tags.transients.clear();
    tags.sampler.loops.clear();
    tags.sampler.markers.clear();
    for (platform::Dictionary* const texts : {&tags.combined, &tags.info})
        for (auto& [key, value] : *texts)
            if (const auto* const text = value.get<std::string>(); text != nullptr && text->size() > kMostOfComment)
                value = boundedLine(*text, kMostOfComment);
}

} // namespace

void addLoopTags(LibraryRecord& record, LoopTags tags)
{
    constexpr std::int64_t kNotALoop = 2;
    const TagSources sources = loopTagSources(tags);
    if (tags.number(VireoLoopCombinedTagsChunkDataFileTypeKey) == kNotALoop)
        record.kind = "one-shot";
    else if (tags.isLoop())
        record.kind = "loop";
    if (const double tempo = tags.tempo(); tempo > 0) {
        record.tempo = tempo;
        record.tempoSource = tagSource(sources, "tempo");
    }
    record.beatCount = positive(tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey));
    addKey(record, tags, sources);
    record.signature = loopSignature(tags);
    record.category = boundedLine(tags.text(VireoLoopCombinedTagsChunkDataInstrumentTypeKey), kMostOfLine);
    record.subCategory = boundedLine(tags.text(VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey), kMostOfLine);
    record.genre = boundedLine(tags.text(VireoLoopCombinedTagsChunkDataGenreKey), kMostOfLine);
    record.descriptors = joinedDescriptors(tags);
    record.title = boundedLine(tags.text(VireoLoopFileInfoChunkDataTitleKey), kMostOfLine);
    record.artist = boundedLine(tags.text(VireoLoopFileInfoChunkDataArtistKey), kMostOfLine);
    record.comment = boundedLine(tags.text(VireoLoopFileInfoChunkDataCommentsKey), kMostOfComment);
    if (tags.isEmpty() && tags.sampler.loops.empty() && tags.sampler.markers.empty())
        return;
    record.tags = objectOf(tags);
    if (record.tags.size() > kMostOfTags) {
        shortenTags(tags);
        record.tags = objectOf(tags);
    }
}
