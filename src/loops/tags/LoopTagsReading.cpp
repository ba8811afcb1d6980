// How a file is read, and which of its chunks hold what.
#include "audiofile/CAudioFileIO.h"
#include "audiofile/FileWindow.h"
#include "loops/VireoLoopUserDataUtils.h"
#include "loops/tags/LoopTagFields.h"
#include "loops/tags/LoopTags.h"
#include "loops/tags/LoopTagsError.h"
#include "media/containers/ContainerHeaders.h"

#include <algorithm>
#include <functional>

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

// The frames of compressed sound without the padding of packets; none if they are not known.
using FrameCount = std::function<std::optional<std::int64_t>()>;

void readLength(AudioFile& file, const FrameCount& frames, LoopTags& tags)
{
    platform::StreamDescription format;
    std::uint64_t packets = 0;
    if (file.dataFormat(format) != kStatusOK || file.audioDataPacketCount(packets) != kStatusOK)
        return;
    tags.sampleRate = format.sampleRate;
    tags.frames = packets * format.framesPerPacket;
    if (const auto counted = format.isLinearPCM() ? std::nullopt : frames())
        tags.frames = static_cast<std::uint64_t>(*counted);
}

// The size of a chunk's body; none if the file does not have the chunk.
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

// An empty chunk of each kind that is carried unchanged.
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
    static const VireoLoopChunkList kinds = carriedKinds(); // never changes: the threads of a scan share it
    std::vector<LoopTags::Chunk> found;
    for (const auto& chunk : kinds)
        if (const auto size = sizeOf(*chunk, file, fileType))
            found.push_back({carriedLoopChunkName(*chunk), *size});
    return found;
}

// A file that cannot be opened as an audio file counts as one of another kind.
bool hasOpened(std::int32_t status, platform::Error* error)
{
    return status == kStatusParameterError ? failWith(error, LoopTagsError::unknownFile, "is no WAVE, AIFF or CAF file")
                                           : succeeded(status, error);
}

struct TextField {
    SamplerTags::Text::Kind kind;
    const char* name;
    const char* key;
};
const TextField kTexts[] = {
    {SamplerTags::Text::Kind::title, "title", VireoLoopFileInfoChunkDataTitleKey},
    {SamplerTags::Text::Kind::artist, "artist", VireoLoopFileInfoChunkDataArtistKey},
    {SamplerTags::Text::Kind::copyright, "copyright", VireoLoopFileInfoChunkDataCopyrightKey},
    {SamplerTags::Text::Kind::comments, "comments", VireoLoopFileInfoChunkDataCommentsKey},
    {SamplerTags::Text::Kind::genre, "genre", VireoLoopCombinedTagsChunkDataGenreKey},
};

// The loop chunks of AIFF and CAF files.
void readLoopChunks(VireoLoopChunksManager& manager, LoopTags& tags)
{
    VireoLoopChunkList list;
    auto& info = addChunk<VireoLoopFileInfoChunk>(list);
    auto& combined = addChunk<VireoLoopCombinedTaggingChunk>(list);
    auto& transients = addChunk<VireoLoopTransientChunk>(list);
    manager.readChunks(list);
    tags.info = std::move(info.fileInfo()).dataDictionary();
    tags.combined = std::move(combined.tags()).dataDictionary();
    tags.transients = transients.transients().transients();
    tags.chunks = carriedChunks(*manager.audioFile(), tags.fileType);
    tags.hasLoopChunks = !tags.combined.empty() || !tags.transients.empty() || !tags.chunks.empty();
}

std::string sourceName(FourCC id)
{
    return id == fourCC("INFO") || id == fourCC("adtl") ? "LIST " + fourCCText(id) : fourCCText(id);
}

std::optional<LoopTags> readTags(std::unique_ptr<AudioFile> opened, const FrameCount& frames, bool withSamplers,
                                 platform::Error* error)
{
    VireoLoopChunksManager manager(std::move(opened));
    AudioFile& file = *manager.audioFile();
    std::optional<LoopTags> read(std::in_place);
    LoopTags& tags = *read;
    tags.fileType = manager.audioFileTypeID();
    const bool holdsLoopChunks = tags.fileType == kAIFF || tags.fileType == kCaff;
    if (tags.fileType == fourCC("NeXT")) {
        failWith(error, LoopTagsError::otherFile, "is an AU file; those hold no tags");
        return std::nullopt;
    }
    readLength(file, frames, tags);
    if (holdsLoopChunks)
        readLoopChunks(manager, tags);
    if (withSamplers || !holdsLoopChunks) {
        SamplerTags sampler;
        if (!succeeded(SamplerTags::read(file, sampler), error))
            return std::nullopt;
        addSamplerTags(tags, std::move(sampler));
    }
    return read;
}

std::optional<LoopTags> readTags(const platform::URLRef& url, bool withSamplers, platform::Error* error)
{
    std::int32_t status = kStatusParameterError;
    auto opened = url != nullptr ? AudioFile::openToRead(*url, &status) : nullptr;
    if (!hasOpened(status, error))
        return std::nullopt;
    const FrameCount frames = [&url]() -> std::optional<std::int64_t> {
        CAudioFileIO description;
        return description.Open(CFileRef(url), 0) == kStatusOK ? std::optional(description.Info().frames)
                                                               : std::nullopt;
    };
    return readTags(std::move(opened), frames, withSamplers, error);
}

} // namespace

std::optional<VireoLoopChunksManager> openLoopFile(const platform::URLRef& file, AudioFile::Permission permission,
                                                   LoopFiles kinds, platform::Error* error)
{
    std::optional<VireoLoopChunksManager> manager(std::in_place, file, permission);
    if (!hasOpened(manager->status(), error))
        return std::nullopt;
    const FourCC type = manager->audioFileTypeID();
    if (type == kAIFF || type == kCaff || (type == kWAVE && kinds == LoopFiles::waveToo))
        return manager;
    failWith(error, LoopTagsError::otherFile,
             std::string(type == kAIFC ? "is an " : "is a ") + loopContainerName(type) +
                 " file; loop tags are put into AIFF, CAF and WAVE files only");
    return std::nullopt;
}

std::vector<LoopTags::Chunk> loopChunksOf(VireoLoopChunksManager& manager)
{
    AudioFile& file = *manager.audioFile();
    const bool aiff = manager.audioFileTypeID() == kAIFF;
    std::vector<LoopTags::Chunk> found = carriedChunks(file, manager.audioFileTypeID());
    for (const std::unique_ptr<VireoLoopBaseChunk>& chunk : VireoLoopChunks::Empty())
        if (chunk->aifChunkID() == tagging::kBasicTagging || chunk->aifChunkID() == tagging::kTransients)
            if (const auto size = sizeOf(*chunk, file, manager.audioFileTypeID()))
                found.push_back({carriedLoopChunkName(*chunk), *size});
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

std::optional<LoopTags> readLoopTags(const platform::URLRef& file, platform::Error* error)
{
    return readTags(file, true, error);
}

std::optional<LoopTags> readLoopTags(CAudioFileIO& file, platform::Error* error)
{
    std::int32_t status = kStatusNotOpen;
    const CFileBytes bytes(file);
    auto opened = file.IsOpen() ? AudioFile::openToRead(bytes, static_cast<std::uint64_t>(file.LengthAtOpen()), &status)
                                : nullptr;
    if (!hasOpened(status, error))
        return std::nullopt;
    return readTags(
        std::move(opened), [&file] { return std::optional(file.Info().frames); }, true, error);
}

std::optional<LoopTags> readOwnLoopTags(const platform::URLRef& file, platform::Error* error)
{
    return readTags(file, false, error);
}

void addSamplerTags(LoopTags& tags, SamplerTags sampler)
{
    const bool knowsTempo = tags.tempo() > 0;
    const auto add = [&](platform::Dictionary& to, const char* name, const char* key, platform::Value value,
                         FourCC source) {
        if (to.try_emplace(key, std::move(value)).second)
            tags.sources[name] = sourceName(source);
    };
    const auto addNumber = [&](const auto& number, const char* name, const char* key) {
        if (number && tags.number(key) == 0) {
            tags.combined.erase(key);
            add(tags.combined, name, key, number->value, number->source);
        }
    };
    addNumber(sampler.beats, "beatCount", VireoLoopCombinedTagsChunkDataBeatCountKey);
    addNumber(sampler.rootNote, "midiRootNote", VireoLoopCombinedTagsChunkDataMidiRootNoteKey);
    addNumber(sampler.signatureTop, "signatureTop", VireoLoopCombinedTagsChunkDataSignatureTopKey);
    addNumber(sampler.signatureBottom, "signatureBottom", VireoLoopCombinedTagsChunkDataSignatureBottomKey);
    if (sampler.isLoop)
        add(tags.combined, "loopFileType", VireoLoopCombinedTagsChunkDataFileTypeKey,
            std::int64_t{sampler.isLoop->value ? 1 : 2}, sampler.isLoop->source);
    if (sampler.tempo && !knowsTempo) {
        tags.statedTempo = sampler.tempo->value;
        tags.sources["tempo"] = sourceName(sampler.tempo->source);
    } else if (tags.tempo() > 0 && !knowsTempo) {
        tags.sources["tempo"] = sourceName(sampler.beats->source);
    }
    for (const SamplerTags::Text& text : sampler.texts)
        for (const auto& [kind, name, key] : kTexts)
            if (kind == text.kind)
                add(kind == SamplerTags::Text::Kind::genre ? tags.combined : tags.info, name, key, text.text,
                    text.source);
    tags.sampler = std::move(sampler);
}
