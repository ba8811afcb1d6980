// Loop files for tests of the chunks manager, and their content as plain text.
#pragma once

#include "loops/VireoLoopChunksManager.h"
#include "media/AudioContainers.h"
#include "media/containers/ContainerHeaders.h"

#include <map>
#include <string>

inline constexpr FourCC kCAF = fourCC("caff");

inline VireoLoopChunksManager manage(const std::string& path, bool forWriting = true)
{
    using namespace platform;
    return VireoLoopChunksManager(URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, false),
                                  forWriting ? AudioFile::Permission::readWrite : AudioFile::Permission::read);
}

/// An audio file without tags, with these chunks after or before its samples.
inline Bytes audioFile(FourCC container, const Chunks& others = {}, bool isAhead = false)
{
    Chunks chunks{formatChunk(container), dataChunk(container)};
    chunks.insert(isAhead ? chunks.end() - 1 : chunks.end(), others.begin(), others.end());
    return buildContainer(container, chunks);
}

/// The samples of a file, which must be readable.
inline std::string samplesOf(const std::string& path)
{
    const auto file = openAudio(path, false);
    EXPECT_TRUE(file != nullptr);
    std::string samples(100, '\0');
    auto count = static_cast<std::uint32_t>(samples.size());
    EXPECT_EQ(file ? file->readBytes(0, count, samples.data()) : -1, 0);
    return samples.substr(0, count);
}

/// One entry per tag: "BeatCount", "Title", "transients", "CHST", "silence".
using Tags = std::map<std::string, std::string>;

inline std::string inWords(const platform::Value& value)
{
    if (const auto* number = value.get<std::int64_t>())
        return std::to_string(*number);
    if (const auto* text = value.get<std::string>())
        return *text;
    std::string joined;
    for (const platform::Value& each : *value.get<platform::Array>())
        joined += "|" + inWords(each);
    return joined;
}

inline Tags tagsIn(const VireoLoopChunkList& list)
{
    constexpr std::string_view combinedPrefix = "VireoLoopCombinedTagsChunkData",
                               infoPrefix = "VireoLoopFileInfoChunkData";
    Tags tags;
    for (const auto& chunk : list)
        if (auto* combined = dynamic_cast<VireoLoopCombinedTaggingChunk*>(chunk.get())) {
            for (const auto& [key, value] : combined->tags().dataDictionary())
                tags[key.substr(combinedPrefix.size())] = inWords(value);
        } else if (auto* info = dynamic_cast<VireoLoopFileInfoChunk*>(chunk.get())) {
            for (const auto& [key, value] : info->fileInfo().dataDictionary())
                tags[key.substr(infoPrefix.size())] = inWords(value);
        } else if (auto* transients = dynamic_cast<VireoLoopTransientChunk*>(chunk.get())) {
            const VireoLoopTransientChunkData& data = transients->transients();
            for (const VireoLoopTransient& each : data.transients())
                tags["transients"] += std::to_string(each.transientType()) + "@" + std::to_string(each.frame()) + " ";
            if (!data.isEmpty())
                tags["transients"] += "version " + std::to_string(data.version().value_or(0)) + ", " +
                                      std::to_string(data.transientDetectionPercentage().value_or(0)) + " %, " +
                                      std::to_string(data.forceDivisionValue().value_or(0));
        } else if (!chunk->chunkData().isEmpty()) {
            const std::string name = chunk->aifChunkID() != 0 ? fourCCText(chunk->aifChunkID()) : "silence";
            tags[name] = textOf(*chunk->chunkData().cafDataRepresentation());
        }
    return tags;
}

inline Tags tagsOf(const std::string& path)
{
    const VireoLoopChunkList list = VireoLoopChunks::Empty();
    manage(path, false).readChunks(list);
    return tagsIn(list);
}

/// Every kind of chunk, with content that both containers can hold; `length` varies its length.
inline VireoLoopChunkList everyKind(std::size_t length)
{
    VireoLoopChunkList list = VireoLoopChunks::Empty();
    const std::string text(length, static_cast<char>('a' + length % 26));
    for (const auto& chunk : list)
        if (auto* combined = dynamic_cast<VireoLoopCombinedTaggingChunk*>(chunk.get())) {
            combined->tags().setDataDictionary(
                {{VireoLoopCombinedTagsChunkDataBeatCountKey, length},
                 {VireoLoopCombinedTagsChunkDataMidiRootNoteKey, 48 + length % 12},
                 {VireoLoopCombinedTagsChunkDataKeyType, 1 + length % 4},
                 {VireoLoopCombinedTagsChunkDataSignatureTopKey, 12},
                 {VireoLoopCombinedTagsChunkDataSignatureBottomKey, 8},
                 {VireoLoopCombinedTagsChunkDataFileTypeKey, 1},
                 {VireoLoopCombinedTagsChunkDataInstrumentTypeKey, "Dr\u00FCms" + text},
                 {VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, "sub" + text},
                 {VireoLoopCombinedTagsChunkDataGenreKey, text},
                 {VireoLoopCombinedTagsChunkDataDescriptorsKey, platform::Array{"Dry", "d" + text, "\u00FC"}}});
        } else if (auto* info = dynamic_cast<VireoLoopFileInfoChunk*>(chunk.get())) {
            info->fileInfo().setDataDictionary({{VireoLoopFileInfoChunkDataTitleKey, "title " + text},
                                                {VireoLoopFileInfoChunkDataArtistKey, "artist " + text},
                                                {VireoLoopFileInfoChunkDataCopyrightKey, "2026 " + text},
                                                {VireoLoopFileInfoChunkDataCommentsKey, "s\u00E4y: a=b, " + text}});
        } else if (auto* transients = dynamic_cast<VireoLoopTransientChunk*>(chunk.get())) {
            transients->transients().setVersion(1);
            transients->transients().setTransientDetectionPercentage(50);
            transients->transients().setForceDivisionValue(-3);
            transients->transients().setTransients({{1, 0}, {1, length}, {7, 0xFFFFFFFF}});
            if (length % 2 == 1)
                transients->transients().setTransients({{2, length}});
        } else {
            const std::string name = chunk->aifChunkID() != 0 ? fourCCText(chunk->aifChunkID()) : "silence";
            const std::string body = name + '\0' + text;
            chunk->chunkData().setChunkData(bytesOf(body), kCAF);
        }
    return list;
}

/// What a file of the container keeps of all kinds.
inline Tags keptIn(FourCC container, const VireoLoopChunkList& list)
{
    Tags tags = tagsIn(list);
    if (container == kAIFF)
        tags.erase("silence");
    return tags;
}
