#include "audiofile/AudioFileInfo.h"

#include "audiofile/ContainerDescriptions.h"
#include "files/CFileIO.h"

#include <cmath>

namespace {

// What REX2 holds below its first chunk is compressed in a way of its own.
std::int32_t describeREX2(AudioFileInfo& info)
{
    info.containerId = kCAT;
    info.formType = kREX2;
    info.compressed = true;
    info.bitsPerSample = 0;
    info.channels = 0;
    SetSampleRate(info, 0);
    return kStatusOK;
}

std::int32_t describe(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info)
{
    std::array<std::byte, 16> start{};
    const std::size_t there = file.readSome(start.data(), 0, start.size());
    if (there >= 8 && loadBE<FourCC>(start.data()) == kCaff) {
        info.fileType = kCaff;
        return DescribeCAF(file, url, info);
    }
    if (there >= 4 && loadBE<FourCC>(start.data()) == fourCC("fLaC"))
        return DescribeFLAC(file, info);
    info.fileType = ChunkedContainerKind(start);
    switch (info.fileType) {
    case kWAVE:
        return DescribeWAVE(file, info);
    case kAIFF:
        return DescribeAIFF(file, info);
    case kREX2:
        return describeREX2(info);
    default:
        return url ? DescribeCompressed(*url, BytesView(start).first(there), info)
                   : std::int32_t{kStatusParameterError};
    }
}

} // namespace

std::int32_t GetAudioFileInfo(CFileIO& file, unsigned int /*permission*/, AudioFileInfo& info)
{
    // no call where none is needed
    FileWindow window(file, file.IsOpenForWriting() ? file.GetEOF() : file.LengthAtOpen());
    return DescribeAudioFile(window, file.IsMemoryFile() ? nullptr : file.URL(), info);
}

std::int32_t DescribeAudioFile(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info)
{
    info = {};
    info.fileLength = file.length();
    const std::int32_t status = describe(file, url, info);
    return file.failure() != kStatusOK ? file.failure() : status;
}

void SetSampleRate(AudioFileInfo& info, double rate)
{
    constexpr double highest = 9007199254740992.0;
    info.exactSampleRate = rate > 0 && rate <= highest ? rate : 0;
    info.sampleRate = std::llround(info.exactSampleRate);
}

void SetStoredFormat(AudioFileInfo& info, const platform::StoredFormat& format)
{
    constexpr std::uint32_t mostChannels = 0xFFFF; // more than that is no sound but a damaged header
    platform::StreamDescription stream = format.stream;
    if (stream.channelsPerFrame > mostChannels)
        stream.channelsPerFrame = stream.bytesPerFrame = 0;
    info.channels = static_cast<std::int32_t>(stream.channelsPerFrame);
    info.busFormat = AudioBusFormatForChannels(info.channels);
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

void SetSampleData(AudioFileInfo& info, std::int64_t offset, std::uint64_t size)
{
    info.dataOffset = offset;
    const std::int64_t there = std::max<std::int64_t>(info.fileLength - offset, 0);
    info.dataSize = static_cast<std::int64_t>(std::min<std::uint64_t>(size, static_cast<std::uint64_t>(there)));
    constexpr std::uint64_t toTheEnd = INT64_MAX; // of a recording that does not say how long it is
    info.missingDataSize = size < toTheEnd ? static_cast<std::int64_t>(size) - info.dataSize : 0;
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

void SetLoopTiming(AudioFileInfo& info, const std::optional<tagging::LoopTiming>& timing)
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

std::uint32_t AudioFileInfo::VireoLoopTempo() const
{
    const double tempo = beatCount * 300000.0 * static_cast<double>(sampleRate) / static_cast<double>(frames);
    return static_cast<std::uint32_t>(static_cast<std::int64_t>(tempo));
}
