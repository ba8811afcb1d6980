#include "audiofile/fields/FileMetadata.h"

#include "audiofile/CAudioFileIO.h"
#include "audiofile/fields/readers/MetaReaders.h"
#include "audiofile/fields/readers/TagReader.h"
#include "platform/core/ASCIICase.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <set>

namespace {

constexpr std::int64_t kMostBytes = 64 << 20;  // of all chunks held whole; an ID3 tag may contain large pictures
constexpr std::int64_t kMostOfText = 16 << 20; // per chunk of text
constexpr std::int64_t kMostOfList = 2 << 20;  // per chunk of numbers, whose fields are fifty times as large
constexpr std::int64_t kHead = 64;             // of other chunks

// Left to `info` and `chunks`: coding, samples, unused room.
constexpr std::array kStructure{fourCC("fmt "), fourCC("data"), fourCC("ds64"), fourCC("COMM"), fourCC("SSND"),
                                fourCC("FVER"), fourCC("desc"), fourCC("pakt"), fourCC("kuki"), fourCC("JUNK"),
                                fourCC("junk"), fourCC("PAD "), fourCC("FLLR"), fourCC("free")};

std::span<const MetaReader> readersOf(platform::ContainerKind kind)
{
    switch (kind) {
    case platform::ContainerKind::iff:
        return aiffReaders();
    case platform::ContainerKind::caf:
        return cafReaders();
    default:
        return waveReaders();
    }
}

std::string lowered(std::string_view text)
{
    std::string small(text);
    std::ranges::transform(small, small.begin(), asciiLower);
    return small;
}

/// Spaces belong to an id, but not to the name of its fields.
std::string groupOf(FourCC id)
{
    const std::string text = fourCCText(id);
    return text.substr(0, std::max<std::size_t>(text.find_last_not_of(' ') + 1, 1));
}

const MetaReader* readerOf(FourCC id, std::span<const MetaReader> readers)
{
    const auto reader = std::ranges::find(readers, id, &MetaReader::id);
    return reader == readers.end() ? nullptr : &*reader;
}

bool isWanted(std::string_view group, const MetaGroups& groups)
{
    const auto isGroup = [group](const std::string& wanted) { return equalIgnoringASCIICase(group, wanted); };
    return groups.empty() || std::ranges::any_of(groups, isGroup);
}

/// Only the form of a LIST tells the group of its fields.
bool isWanted(FourCC id, const MetaReader* reader, const MetaGroups& groups)
{
    if (groups.empty())
        return true;
    if (id == fourCC("LIST"))
        return isWanted("LIST", groups) || isWanted("info", groups) || isWanted("cue", groups);
    return reader != nullptr ? isWanted(reader->group, groups) : isWanted(groupOf(id), groups);
}

/// Whether reading a wanted chunk requires this one.
bool isReferredTo(FourCC id, std::span<const MetaReader> readers, const MetaGroups& groups)
{
    return std::ranges::any_of(readers, [&](const MetaReader& reader) {
        return reader.refersTo == id && isWanted(reader.id, &reader, groups);
    });
}

/// How large a chunk may be to be held whole.
std::int64_t mostOf(const MetaReader& reader)
{
    if (reader.read == readPreview)
        return 0;
    if (reader.read == readID3)
        return kMostBytes;
    const bool isText = reader.read == readText || reader.read == readIXML || reader.read == readADM;
    return isText ? kMostOfText : kMostOfList;
}

bool failWith(platform::Error* error, MetadataError code, std::string description)
{
    return platform::fail(error, kMetadataErrorDomain, static_cast<std::int64_t>(code), std::move(description));
}

bool succeeded(std::int32_t status, platform::Error* error)
{
    return status == kStatusOK || platform::fail(error, platform::ErrorDomain::status, status, StatusText(status));
}

/// Collects the chunks that may be metadata, in file order; sets `extent` to the container's.
bool collect(CAudioFileIO& file, const MetaGroups& groups, ContainerExtent& extent, MetaSource& source,
             platform::Error* error)
{
    std::int32_t readStatus = kStatusOK;
    std::int64_t room = kMostBytes;
    const std::int32_t status = file.ForEachChunk(
        [&](const ChunkEntry& entry) {
            if (std::ranges::find(kStructure, entry.id) != kStructure.end())
                return true;
            const std::span<const MetaReader> readers = readersOf(extent.kind);
            const MetaReader* const reader = readerOf(entry.id, readers);
            if (!isWanted(entry.id, reader, groups) && !isReferredTo(entry.id, readers, groups))
                return true;
            MetaChunk& chunk = source.chunks.emplace_back();
            chunk.id = entry.id;
            chunk.offset = entry.offset;
            chunk.size = std::max<std::int64_t>(entry.size, 0);
            const std::int64_t there = std::clamp<std::int64_t>(extent.fileLength - entry.body, 0, chunk.size);
            chunk.isHeld = reader != nullptr && there <= std::min(room, mostOf(*reader));
            chunk.body.resize(static_cast<std::size_t>(chunk.isHeld ? there : std::min(there, kHead)));
            room -= std::ssize(chunk.body);
            if (!chunk.body.empty())
                readStatus = file.Read(chunk.body.data(), entry.body, std::ssize(chunk.body), nullptr);
            return readStatus == kStatusOK;
        },
        &extent);
    if (!succeeded(readStatus, error))
        return false;
    if (status != kStatusOK)
        return failWith(error, MetadataError::badHeader,
                        source.chunks.empty() ? "its container header cannot be read"
                                              : "a chunk header cannot be read");
    source.order = extent.kind == platform::ContainerKind::riff || extent.kind == platform::ContainerKind::wave64
                       ? std::endian::little
                       : std::endian::big;
    return true;
}

void readChunk(const MetaChunk& chunk, std::span<const MetaReader> readers, const MetaSource& source,
               const MetaGroups& groups, MetaFields& fields)
{
    const MetaReader* const reader = readerOf(chunk.id, readers);
    if (!isWanted(chunk.id, reader, groups))
        return;
    if (chunk.id == fourCC("LIST")) // the form determines the reader
        fields.enterShared(chunk, "LIST");
    else
        fields.enter(chunk, reader != nullptr ? reader->group : groupOf(chunk.id));
    if (reader == nullptr || !chunk.isHeld || !reader->read(chunk, source, fields))
        fields.preview("", chunk.body, static_cast<std::uint64_t>(chunk.size));
}

std::optional<HeldMetadata> holdChunks(CAudioFileIO& file, const MetaGroups& groups, platform::Error* error)
{
    ContainerExtent extent;
    std::optional<HeldMetadata> held(std::in_place);
    if (!collect(file, groups, extent, held->source, error))
        return std::nullopt;
    held->container = extent.id;
    held->kind = extent.kind;
    held->sampleRate = file.Info().exactSampleRate;
    held->frames = file.InfoStatus() == kStatusOK ? file.Info().frames : -1;
    return held;
}

std::optional<FileMetadata> readFields(CAudioFileIO& file, const CFileRef& ref, const MetaGroups& groups,
                                       platform::Error* error)
{
    std::optional<FileMetadata> metadata;
    if (!file.HasChunks())
        metadata = readTags(file, ref, error);
    else if (const auto held = holdChunks(file, groups, error))
        metadata = FileMetadata{held->container, MetadataFieldsOf(*held, groups)};
    if (metadata && !groups.empty())
        std::erase_if(metadata->fields, [&](const MetaField& field) { return !isWanted(field.group, groups); });
    return metadata;
}

/// Reads headers and neighbouring chunks at once, into a block that a thread reuses for file after file.
void readAhead(CAudioFileIO& file)
{
    constexpr std::size_t size = 4096;
    thread_local auto block = std::make_shared<KTMem>(size);
    if (block.use_count() > 1) // in use by a file that is open
        block = std::make_shared<KTMem>(size);
    file.SetCache(block);
}

} // namespace

std::optional<HeldMetadata> HoldMetadata(const CFileRef& ref, const MetaGroups& groups, platform::Error* error)
{
    CAudioFileIO file;
    readAhead(file);
    if (!succeeded(file.OpenForChunks(ref, 0), error))
        return std::nullopt;
    if (file.HasChunks())
        return holdChunks(file, groups, error);
    failWith(error, MetadataError::noChunks, "holds no chunks");
    return std::nullopt;
}

std::vector<MetaField> MetadataFieldsOf(const HeldMetadata& held, const MetaGroups& groups)
{
    using platform::FallbackEncoding;
    MetaFields fields(held.sampleRate,
                      held.container == kFORM ? FallbackEncoding::macintosh : FallbackEncoding::latin1);
    const std::span<const MetaReader> readers = readersOf(held.kind);
    for (const MetaChunk& chunk : held.source.chunks)
        readChunk(chunk, readers, held.source, groups, fields);
    return fields.take();
}

std::optional<FileMetadata> ReadMetadataFields(const CFileRef& ref, const MetaGroups& groups, platform::Error* error)
{
    CAudioFileIO file;
    readAhead(file);
    if (!succeeded(file.OpenForChunks(ref, 0), error))
        return std::nullopt;
    return readFields(file, ref, groups, error);
}

std::optional<FileMetadata> ReadMetadataFieldsOfOpenFile(CAudioFileIO& file, const MetaGroups& groups,
                                                         platform::Error* error)
{
    if (!succeeded(file.IsOpen() ? kStatusOK : kStatusNotOpen, error))
        return std::nullopt;
    return readFields(file, file, groups, error);
}

std::vector<std::string> MetadataGroupNames()
{
    std::set<std::string> groups{"info"}; // "adtl" is a LIST too, but belongs to "cue"
    for (const auto& readers : {waveReaders(), aiffReaders(), cafReaders()})
        for (const MetaReader& reader : readers)
            groups.insert(lowered(reader.group));
    for (const std::string_view group : tagGroups())
        groups.emplace(group);
    return {groups.begin(), groups.end()};
}
