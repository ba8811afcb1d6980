#include "audiofile/AudioFileInfo.h"

#include "audiofile/BusFormats.h"
#include "audiofile/ContainerDescriptions.h"
#include "files/CFileIO.h"
#include "loops/tagging/ChunkIDs.h"
#include "loops/tagging/Chunks.h"
#include "loops/tagging/LoopTiming.h"
#include "media/containers/AudioDescription.h"
#include "media/decoding/CompressedAudio.h"

#include <array>
#include <cmath>
#include <optional>

namespace {

using platform::ContainerKind;

TAudioBusFormat busFormatOf(const platform::StoredFormat& format, std::int32_t channels)
{
    return format.speakers ? BusFormatOf(*format.speakers, channels) : AudioBusFormatForChannels(channels);
}

/// Sets channels, rate and coding, and for linear PCM the layout of the samples, which are left-aligned in their bytes.
void setStoredFormat(AudioFileInfo& info, const platform::StoredFormat& format)
{
    constexpr std::uint32_t mostChannels = 0xFFFF; // a header that claims more is damaged
    platform::StreamDescription stream = format.stream;
    if (stream.channelsPerFrame > mostChannels)
        stream.channelsPerFrame = stream.bytesPerFrame = 0;
    info.channels = static_cast<std::int32_t>(stream.channelsPerFrame);
    info.busFormat = busFormatOf(format, info.channels);
    SetSampleRate(info, stream.sampleRate);
    info.formatCode = format.coding;
    const std::uint32_t bytesPerSample =
        stream.channelsPerFrame > 0 ? stream.bytesPerFrame / stream.channelsPerFrame : 0;
    info.sampleFormat = stream.sampleFormat();
    info.sampleFormat.bits = static_cast<int>(bytesPerSample * 8);
    if (bytesPerSample <= 1)
        info.sampleFormat.order = std::endian::native;
    info.compressed = !stream.isLinearPCM() || (bytesPerSample > 0 && !info.sampleFormat.isSupported());
    info.bitsPerSample = info.compressed ? 0 : info.sampleFormat.bits;
    if (info.compressed) {
        info.sampleFormat = {};
        return;
    }
    info.sourceBits = static_cast<std::int32_t>(format.validBits > 0 ? format.validBits : stream.bitsPerChannel);
    info.floatingPoint = info.sampleFormat.isFloat;
    info.byteSwapped = info.sampleFormat.order != std::endian::native;
    info.bytesPerFrame = static_cast<std::int32_t>(stream.bytesPerFrame);
}

/// Sets the loop fields, which stand last.
void setLoopTiming(AudioFileInfo& info, const std::optional<tagging::LoopTiming>& timing)
{
    if (!timing)
        return;
    const double beats = std::max(timing->beatCount, 0);
    info.beatCount = static_cast<float>(beats);
    info.timingFlag = 1;
    info.loopCount = timing->isLoop ? 1 : 0;
    if (info.frames > 0)
        info.loopValue = static_cast<float>(beats * 60 * info.exactSampleRate / static_cast<double>(info.frames));
}

/// Reads the timing from a loop's basic tagging chunk; none for any other chunk.
std::optional<tagging::LoopTiming> readLoopTiming(FileWindow& file, ContainerKind kind,
                                                  const platform::WalkedChunk& chunk)
{
    const auto size = static_cast<std::uint64_t>(chunk.size);
    if (kind == ContainerKind::iff && chunk.id == tagging::kBasicTagging) {
        std::array<std::byte, sizeof(tagging::BasicTaggingChunk)> bytes;
        const bool there = size >= bytes.size() && file.get(bytes, chunk.body);
        return there ? tagging::LoopTimingInAIFF(bytes) : std::nullopt;
    }
    constexpr std::uint64_t most = 1 << 20; // bytes of text that are searched
    tagging::UUIDBytes uuid;
    if (kind != ContainerKind::caf || chunk.id != kUuid || size < sizeof uuid || !file.get(uuid, chunk.body) ||
        cafChunkUUIDToChunkID(&uuid) != tagging::kBasicTagging)
        return std::nullopt;
    const std::uint64_t start = chunk.body + sizeof uuid;
    Bytes payload(static_cast<std::size_t>(std::min({size - sizeof uuid, file.length() - start, most})));
    payload.resize(file.readSome(payload.data(), start, payload.size()));
    return tagging::LoopTimingInCAF(payload);
}

/// Counts the packets of a CAF file that are present, where the library can find them.
void countPackets(const platform::URLRef& url, const platform::StoredFormat& format, AudioFileInfo& info)
{
    platform::CompressedAudio packets;
    if (!url || platform::describePackets(*url, packets) != kStatusOK)
        return;
    info.framesAreStated = false;
    SetSampleRate(info, packets.format.sampleRate);
    info.channels = static_cast<std::int32_t>(packets.format.channelsPerFrame);
    info.busFormat = busFormatOf(format, info.channels);
    info.sourceBits = static_cast<std::int32_t>(packets.format.bitsPerChannel);
    info.frames = static_cast<std::int64_t>(packets.frames);
    SetSoundFacts(info, packets.facts);
}

/// kStatusEndOfFile if a part that files of the kind need is missing, else 0.
std::int32_t describeContainer(FileWindow& file, platform::ChunkWalk& walk, const platform::URLRef& url,
                               AudioFileInfo& info)
{
    const platform::Container& container = walk.container();
    const ContainerKind kind = container.traits->kind;
    info.fileType = container.traits->fileType;
    info.containerId = container.traits->isEditable ? container.id : info.fileType;
    info.formType = container.formType;
    // A REX2 file holds compressed sound below its first chunk, in a coding of its own.
    if (kind == ContainerKind::rex2) {
        info.containerId = kCAT;
        info.compressed = true;
        info.bitsPerSample = info.channels = 0;
        SetSampleRate(info, 0);
        return kStatusOK;
    }
    const bool mayHaveTiming = kind == ContainerKind::iff || kind == ContainerKind::caf;
    std::optional<tagging::LoopTiming> timing;
    platform::AudioDescriber describer(file, container);
    while (!(describer.isComplete() && (timing || !mayHaveTiming)) && walk.next()) {
        describer.meet(walk.chunk());
        if (!timing)
            timing = readLoopTiming(file, kind, walk.chunk());
    }
    const platform::AudioDescription audio = describer.description();
    info.dataOffset = static_cast<std::int64_t>(audio.dataOffset);
    info.dataSize = static_cast<std::int64_t>(audio.dataSize);
    info.missingDataSize = static_cast<std::int64_t>(audio.missingDataSize);
    if (!audio.format)
        return kStatusEndOfFile;
    setStoredFormat(info, *audio.format);
    info.speakers = audio.layout;
    info.frames = info.compressed || info.bytesPerFrame > 0 ? static_cast<std::int64_t>(audio.frames) : 0;
    info.framesAreStated = audio.framesAreStated || (info.compressed && audio.stream().isLinearPCM());
    if (kind == ContainerKind::caf && info.compressed)
        countPackets(url, *audio.format, info);
    setLoopTiming(info, timing);
    const bool needsSound = kind != ContainerKind::iff || audio.format->countedPackets > 0;
    return needsSound && !audio.hasSound ? kStatusEndOfFile : kStatusOK;
}

std::int32_t describe(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info)
{
    std::array<std::byte, 16> start{};
    const std::size_t there = file.readSome(start.data(), 0, start.size());
    if (there >= 4 && loadBE<FourCC>(start.data()) == fourCC("fLaC"))
        return DescribeFLAC(file, info);
    platform::ChunkWalk walk(file, platform::WalkPolicy::toTheSound);
    const std::int32_t status = walk.begin();
    if (status != kStatusParameterError)
        return status == kStatusOK ? describeContainer(file, walk, url, info) : status;
    return url ? DescribeCompressed(*url, BytesView(start).first(there), info) : std::int32_t{kStatusParameterError};
}

} // namespace

std::int32_t GetAudioFileInfo(CFileIO& file, unsigned int /*permission*/, AudioFileInfo& info)
{
    // A file that is open for reading needs no call: its length at opening serves.
    FileWindow window(file, file.IsOpenForWriting() ? file.GetEOF() : file.LengthAtOpen());
    return DescribeAudioFile(window, file.IsMemoryFile() ? nullptr : file.URL(), info);
}

std::int32_t DescribeAudioFile(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info)
{
    info = {};
    info.fileLength = file.fileLength();
    const std::int32_t status = describe(file, url, info);
    return file.failure() != kStatusOK ? file.failure() : status;
}

void SetSampleRate(AudioFileInfo& info, double rate)
{
    constexpr double highest = 9007199254740992.0;
    info.exactSampleRate = rate > 0 && rate <= highest ? rate : 0;
    info.sampleRate = std::llround(info.exactSampleRate);
}

void SetSoundFacts(AudioFileInfo& info, const platform::SoundFacts& facts)
{
    constexpr std::uint64_t most = INT64_MAX;
    if (info.speakers == 0)
        info.speakers = facts.speakers;
    info.profile = facts.profile;
    info.audioTracks = static_cast<std::int32_t>(std::min<std::uint32_t>(facts.tracks, INT32_MAX));
    info.dsdRate = static_cast<std::int64_t>(std::min(facts.bitstreamRate, most));
    const auto promised = static_cast<std::int64_t>(std::min(facts.promisedFrames, most));
    info.promisedFrames = std::max(info.promisedFrames, promised);
    if (info.promisedFrames <= info.frames)
        info.promisedFrames = 0;
}

std::uint32_t AudioFileInfo::VireoLoopTempo() const
{
    const double tempo = beatCount * 300000.0 * static_cast<double>(sampleRate) / static_cast<double>(frames);
    return static_cast<std::uint32_t>(static_cast<std::int64_t>(tempo));
}
