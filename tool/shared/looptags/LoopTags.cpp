#include "tool/shared/looptags/LoopTags.h"

#include "audiofile/CAudioFileIO.h"
#include "loops/VireoLoopTerms.h"
#include "loops/VireoLoopUserDataUtils.h"
#include "media/containers/ContainerHeaders.h"
#include "tool/shared/arguments/QuotedText.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/looptags/LoopTagFields.h"
#include "tool/shared/output/JsonWriter.h"
#include "tool/shared/output/Output.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <filesystem>

using platform::AudioFile;

namespace {

template <class Chunk>
Chunk& addChunk(VireoLoopChunkList& list)
{
    auto chunk = std::make_unique<Chunk>();
    Chunk& added = *chunk;
    list.push_back(std::move(chunk));
    return added;
}

void readLength(AudioFile& file, const std::string& path, LoopTags& tags)
{
    platform::StreamDescription format;
    std::uint64_t packets = 0;
    if (file.dataFormat(format) != kStatusOK || file.audioDataPacketCount(packets) != kStatusOK)
        return;
    tags.sampleRate = format.sampleRate;
    tags.frames = packets * format.framesPerPacket;
    CAudioFileIO description;
    if (!format.isLinearPCM() && description.Open(referenceTo(path), 0) == kStatusOK)
        tags.frames = static_cast<std::uint64_t>(description.Info().frames); // without what fills packets up
}

// The size of a chunk's body; none when the file does not have it.
std::optional<std::uint32_t> sizeOf(const VireoLoopBaseChunk& chunk, AudioFile& file, FourCC fileType)
{
    const bool aiff = fileType == kAIFF;
    if (aiff && chunk.aifChunkID() == 0)
        return std::nullopt;
    const bool byUUID = !aiff && chunk.cafChunkIsUUIDChunk();
    const auto index = byUUID ? VireoLoopUUIDUserDataUtils::find(file, *chunk.cafChunkUUID()) : 0;
    std::uint32_t size = 0;
    if (!index || file.userDataSize(aiff ? chunk.aifChunkID() : chunk.cafChunkID(), *index, size) != kStatusOK)
        return std::nullopt;
    return byUUID ? size - static_cast<std::uint32_t>(tagging::kUUIDSize) : size;
}

// An empty chunk of each kind that is carried as it is.
VireoLoopChunkList carriedKinds()
{
    VireoLoopChunkList kinds = VireoLoopChunks::Empty();
    std::erase_if(kinds, [](const auto& chunk) {
        return dynamic_cast<const VireoLoopGenericChunkData*>(&chunk->chunkData()) == nullptr ||
               dynamic_cast<const VireoLoopCombinedTagsChunkData*>(&chunk->chunkData()) != nullptr;
    });
    return kinds;
}

std::vector<LoopTags::Chunk> carriedChunks(AudioFile& file, FourCC fileType)
{
    static const VireoLoopChunkList kinds = carriedKinds(); // never changed: the threads of a scan share it
    std::vector<LoopTags::Chunk> found;
    for (const auto& chunk : kinds)
        if (const auto size = sizeOf(*chunk, file, fileType))
            found.push_back({carriedChunkName(*chunk), *size});
    return found;
}

std::string keyText(const LoopTags& tags)
{
    const std::int64_t note = tags.number(VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    const std::int64_t type = tags.number(VireoLoopCombinedTagsChunkDataKeyType);
    const std::string mode = type == 0   ? ""
                             : type == 3 ? "neither major nor minor"
                             : type == 4 ? "major and minor"
                                         : modeName(type);
    if (note == 0)
        return mode;
    return noteName(note) + (mode.empty() ? "" : " " + mode);
}

std::string signatureText(const LoopTags& tags)
{
    const std::int64_t top = tags.number(VireoLoopCombinedTagsChunkDataSignatureTopKey);
    const std::int64_t bottom = tags.number(VireoLoopCombinedTagsChunkDataSignatureBottomKey);
    return top == 0 || bottom == 0 ? "" : fmt::format("{}/{}", top, bottom);
}

std::string numberText(std::int64_t number)
{
    return number == 0 ? "" : std::to_string(number);
}

// One part of a signature without the other.
template <const char* const& part>
std::string aloneText(const LoopTags& tags)
{
    return signatureText(tags).empty() ? numberText(tags.number(part)) : "";
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

// Frames, each with its type unless that is the usual one.
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

template <const char* const& key>
std::string text(const LoopTags& tags)
{
    return quotedText(tags.text(key));
}

// What is shown of a loop, in order.
struct ShownTag {
    const char* name;
    const char* label;
    std::string (*text)(const LoopTags& tags);
    std::string (*brief)(const LoopTags& tags) = nullptr; // null: the same
};
const ShownTag kShownTags[] = {
    {"tempo", "Tempo", tempoText},
    {"beatCount", "Beats",
     [](const LoopTags& tags) { return numberText(tags.number(VireoLoopCombinedTagsChunkDataBeatCountKey)); }},
    {"key", "Key", keyText},
    {"signature", "Signature", signatureText},
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
    {"chunks", "Chunks", chunksText},
};

} // namespace

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
    return VireoLoopTempo(number(VireoLoopCombinedTagsChunkDataBeatCountKey), frames, sampleRate);
}

const char* loopContainerName(FourCC fileType)
{
    return fileType == kAIFF ? "AIFF" : "CAF";
}

VireoLoopChunksManager openLoopFile(const std::string& path, AudioFile::Permission permission)
{
    std::error_code error;
    const std::string absolute = path.starts_with('/') ? path : std::filesystem::absolute(path, error).string();
    const platform::String location = platform::String::fromFileSystemRepresentation(absolute.c_str());
    if (location.isNull())
        throw Failure("its path is not valid UTF-8");
    VireoLoopChunksManager manager(platform::URL::createWithFileSystemPath(location, platform::PathStyle::posix, false),
                                   permission);
    if (manager.status() != kStatusOK)
        requireRegularFile(path); // says best what is wrong with it
    if (manager.status() == kStatusParameterError)
        throw OtherKind("is no AIFF or CAF file", OtherKind::Kind::unknown);
    requireOK(manager.status());
    const FourCC type = manager.audioFileTypeID();
    if (type != kAIFF && type != kCaff)
        throw OtherKind(fmt::format("is {} file; only AIFF and CAF files hold loop tags",
                                    type == kWAVE ? "a WAVE" : "an " + fourCCText(type)),
                        OtherKind::Kind::audio);
    return manager;
}

std::vector<LoopTags::Chunk> loopChunksOf(VireoLoopChunksManager& manager)
{
    AudioFile& file = *manager.audioFile();
    const bool aiff = manager.audioFileTypeID() == kAIFF;
    std::vector<LoopTags::Chunk> found = carriedChunks(file, manager.audioFileTypeID());
    for (const std::unique_ptr<VireoLoopBaseChunk>& chunk : VireoLoopChunks::Empty())
        if (chunk->aifChunkID() == tagging::kBasicTagging || chunk->aifChunkID() == tagging::kTransients)
            if (const auto size = sizeOf(*chunk, file, manager.audioFileTypeID()))
                found.push_back({carriedChunkName(*chunk), *size});
    std::uint32_t size = 0;
    for (const FourCC id : {tagging::kCategories, fourCC("NAME"), fourCC("AUTH"), fourCC("(c) "), fourCC("COMT")})
        if (aiff && file.userDataSize(id, 0, size) == kStatusOK)
            found.push_back({fourCCText(id), size});
    platform::Dictionary information;
    if (!aiff && file.information(information) == kStatusOK)
        for (const char* key : {"title", "artist", "copyright", "comments"})
            if (const auto* text = platform::find<std::string>(information, key))
                found.push_back({key, static_cast<std::uint32_t>(text->size())});
    return found;
}

LoopTags readLoopTags(const std::string& path)
{
    VireoLoopChunksManager manager = openLoopFile(path, AudioFile::Permission::read);
    VireoLoopChunkList list;
    auto& info = addChunk<VireoLoopFileInfoChunk>(list);
    auto& combined = addChunk<VireoLoopCombinedTaggingChunk>(list);
    auto& transients = addChunk<VireoLoopTransientChunk>(list);
    manager.readChunks(list);
    LoopTags tags;
    tags.fileType = manager.audioFileTypeID();
    tags.info = std::move(info.fileInfo()).dataDictionary();
    tags.combined = std::move(combined.tags()).dataDictionary();
    tags.transients = transients.transients().transients();
    readLength(*manager.audioFile(), path, tags);
    tags.chunks = carriedChunks(*manager.audioFile(), tags.fileType);
    return tags;
}

std::vector<TagLine> tagLines(const LoopTags& tags)
{
    std::vector<TagLine> lines;
    for (const ShownTag& shown : kShownTags)
        if (std::string text = shown.text(tags); !text.empty())
            lines.push_back({shown.name, shown.label, text, shown.brief != nullptr ? shown.brief(tags) : text});
    return lines;
}

std::string tagText(const LoopTags& tags, const char* name)
{
    const auto shown = std::find_if(std::begin(kShownTags), std::end(kShownTags),
                                    [&](const ShownTag& each) { return std::strcmp(each.name, name) == 0; });
    return shown->text(tags);
}

bool isAbsent(const platform::Value& value)
{
    if (const auto* number = value.get<std::int64_t>())
        return *number == 0;
    if (const auto* number = value.get<double>())
        return *number == 0;
    if (const auto* text = value.get<std::string>())
        return text->empty();
    const auto* list = value.get<platform::Array>();
    return list == nullptr || std::all_of(list->begin(), list->end(), isAbsent);
}

std::vector<TagValue> tagValues(const LoopTags& tags)
{
    std::vector<TagValue> present;
    for (const TagField& field : tagFields()) {
        const platform::Dictionary& values = field.isFileInfo ? tags.info : tags.combined;
        const auto found = field.key != nullptr ? values.find(field.key) : values.end();
        if (found != values.end() && !isAbsent(found->second))
            present.push_back({field.name, found->second});
    }
    if (const double tempo = tags.tempo(); tempo > 0)
        present.push_back({"tempo", tempo});
    return present;
}

std::vector<TagValue> tagRecord(const LoopTags& tags)
{
    std::vector<TagValue> record{{"fileType", fourCCText(tags.fileType)},
                                 {"containerName", loopContainerName(tags.fileType)}};
    if (tags.sampleRate > 0) {
        record.push_back({"sampleRate", std::llround(tags.sampleRate)});
        record.push_back({"frames", tags.frames});
        record.push_back({"durationSeconds", static_cast<double>(tags.frames) / tags.sampleRate});
    }
    for (TagValue& tag : tagValues(tags)) {
        const auto* const number = tag.value.get<std::int64_t>();
        const std::string_view note = tag.name == "midiRootNote" && number ? VireoLoopNoteName(*number) : "";
        const std::string_view mode = tag.name == "keyType" && number ? VireoLoopModeName(*number) : "";
        const bool endsSignature = tag.name == "signatureBottom" && !signatureText(tags).empty();
        record.push_back(std::move(tag));
        if (!note.empty())
            record.push_back({"key", std::string(note)});
        if (!mode.empty())
            record.push_back({"mode", std::string(mode)});
        if (endsSignature)
            record.push_back({"signature", signatureText(tags)});
    }
    return record;
}

void writeLoopTags(JsonWriter& json, const std::string& path, const LoopTags& tags)
{
    json.beginObject().member("path", path);
    for (const TagValue& tag : tagRecord(tags))
        json.member(tag.name, tag.value);
    if (!tags.chunks.empty()) {
        json.key("chunks").beginArray();
        for (const LoopTags::Chunk& chunk : tags.chunks)
            json.beginObject().member("id", chunk.id).member("size", chunk.size).endObject();
        json.endArray();
    }
    if (!tags.transients.empty()) { // there may be millions
        json.key("transients").beginArray();
        for (const VireoLoopTransient& transient : tags.transients)
            json.beginObject().member("type", transient.transientType()).member("frame", transient.frame()).endObject();
        json.endArray();
    }
    json.endObject();
}
