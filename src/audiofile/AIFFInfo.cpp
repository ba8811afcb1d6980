// AIFF and AIFC. Published sources: Audio Interchange File Format 1.3, AIFF-C draft of 1991-08-26.
#include "audiofile/ContainerDescriptions.h"

#include "loops/tagging/ChunkIDs.h"
#include "loops/tagging/Chunks.h"
#include <optional>

namespace {

std::optional<platform::StoredFormat> readCommon(FileWindow& file, std::int64_t body, std::int64_t size, bool isAIFC)
{
    std::array<std::byte, platform::kMostOfStoredFormat> bytes{};
    const auto wanted = static_cast<std::size_t>(std::clamp<std::int64_t>(size, 0, std::int64_t{bytes.size()}));
    const std::size_t there = file.readSome(bytes.data(), body, wanted);
    return platform::storedFormatOfAIFF(BytesView(bytes).first(there), isAIFC);
}

// Kept: sizes of 2 GiB and more are taken as they are, although they end a walk.
void setSoundData(FileWindow& file, const ContainerChkExtended& header, const ChkHeader& chunk, std::int64_t body,
                  AudioFileInfo& info)
{
    const std::uint64_t stored = chunk.size;
    const bool isOpen = platform::isUnfinished(platform::ContainerKind::iff, {.body = static_cast<std::uint64_t>(body),
                                                                              .size = static_cast<std::int64_t>(stored),
                                                                              .isOpen = stored == 0xFFFFFFFF,
                                                                              .containerSize = header.EffectiveSize()});
    const std::uint64_t size = isOpen ? UINT64_MAX : stored;
    const std::uint64_t there = std::min(size, static_cast<std::uint64_t>(file.length() - body));
    std::array<std::byte, 4> start{};
    const std::size_t got = file.readSome(start.data(), body, start.size());
    const std::uint64_t lead = platform::soundDataLead(there, BytesView(start).first(got));
    SetSampleData(info, body + static_cast<std::int64_t>(lead), isOpen ? UINT64_MAX : size - lead);
}

std::optional<tagging::LoopTiming> readLoopTiming(FileWindow& file, std::int64_t body, std::int64_t size)
{
    std::array<std::byte, sizeof(tagging::BasicTaggingChunk)> bytes;
    const bool there = size >= std::int64_t{bytes.size()} && file.read(bytes.data(), body, bytes.size()) == kStatusOK;
    return there ? tagging::LoopTimingInAIFF(bytes) : std::nullopt;
}

// Of linear PCM what the file counts, where that is there; a count of 0 with samples behind it was never filled in.
// Packets of one size are those that are there: some writers count frames, or the packets of all channels as one.
std::int64_t framesOf(const platform::StoredFormat& format, const AudioFileInfo& info)
{
    const auto counted = static_cast<std::int64_t>(format.countedPackets);
    const platform::StreamDescription& stream = format.stream;
    if (stream.bytesPerPacket == 0)
        return info.compressed ? counted : 0;
    const std::int64_t there = info.dataSize / stream.bytesPerPacket;
    return info.compressed || counted == 0 ? there * stream.framesPerPacket : std::min(counted, there);
}

} // namespace

std::int32_t DescribeAIFF(FileWindow& file, AudioFileInfo& info)
{
    info.formType = kAIFF;
    ContainerChkExtended header;
    const auto read = [&](void* to, std::int64_t at, std::size_t count) { return file.read(to, at, count); };
    if (ReadContainerHeaderFrom(read, header) != kStatusOK)
        return kStatusEndOfFile;
    info.containerId = header.id;
    info.formType = header.formType;
    std::optional<platform::StoredFormat> common;
    bool hasCommon = false; // a chunk of that id, if only the start of one
    std::optional<tagging::LoopTiming> timing;
    bool hasData = false;
    VisitChunks(file, header, [&](const ChkHeader& chunk, std::int64_t body) {
        if (chunk.id == fourCC("COMM") && !hasCommon) {
            hasCommon = true;
            common = readCommon(file, body, chunk.EffectiveSize(header), header.formType == kAIFC);
        } else if (chunk.id == fourCC("SSND") && !hasData) {
            setSoundData(file, header, chunk, body, info);
            hasData = true;
        } else if (chunk.id == tagging::kBasicTagging && !timing) {
            timing = readLoopTiming(file, body, chunk.EffectiveSize(header));
        }
        return !(hasCommon && hasData && timing);
    });
    if (!common)
        return kStatusEndOfFile;
    SetStoredFormat(info, *common);
    info.frames = framesOf(*common, info);
    const platform::StreamDescription& stream = common->stream;
    info.framesAreStated = info.compressed && (stream.bytesPerPacket == 0 || stream.isLinearPCM());
    SetLoopTiming(info, timing);
    // Without frames there need be no sound data.
    return hasData || common->countedPackets == 0 ? kStatusOK : kStatusEndOfFile;
}
