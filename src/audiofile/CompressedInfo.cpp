// Compressed audio outside the containers.
#include "audiofile/ContainerDescriptions.h"

#include "media/decoding/CompressedAudio.h"
#include "media/packets/FLACInfo.h"

#include <algorithm>
#include <limits>

namespace {

/// Sets the fields of `info` that all of these formats have in common.
void setCompressed(AudioFileInfo& info, FourCC fileType, const platform::StreamDescription& format,
                   std::uint64_t frames)
{
    constexpr std::uint64_t most = std::numeric_limits<std::int64_t>::max();
    info.fileType = info.containerId = fileType;
    info.compressed = true;
    info.formatCode = format.formatId;
    info.bitsPerSample = 0;
    // Their bits are those of the codes, not of samples.
    const bool isLossy = format.bytesPerPacket > 0 && !format.isLinearPCM();
    info.sourceBits = isLossy ? 0 : static_cast<std::int32_t>(std::min<std::uint32_t>(format.bitsPerChannel, 64));
    info.channels = static_cast<std::int32_t>(std::min<std::uint32_t>(format.channelsPerFrame, 0xFFFF));
    info.busFormat = AudioBusFormatForChannels(info.channels);
    SetSampleRate(info, format.sampleRate);
    info.frames = static_cast<std::int64_t>(std::min(frames, most));
}

} // namespace

std::int32_t DescribeFLAC(FileWindow& file, AudioFileInfo& info)
{
    platform::FLACInfo found;
    const std::int32_t status = platform::readFLACInfo(file, found);
    setCompressed(info, fourCC("flac"), found.format, found.frames);
    info.speakers = found.speakers;
    info.promisedFrames = static_cast<std::int64_t>(found.statedFrames); // if the decoder finds fewer
    info.framesAreStated = found.framesAreStated;
    return status;
}

std::int32_t DescribeCompressed(const platform::URL& url, BytesView start, AudioFileInfo& info)
{
    platform::CompressedAudio audio;
    const std::int32_t status = platform::describeCompressedAudio(url, start, audio);
    if (audio.fileType != 0) {
        setCompressed(info, HostFileType(audio.fileType), audio.format, audio.frames);
        SetSoundFacts(info, audio.facts);
    }
    return status;
}

FourCC HostFileType(FourCC type)
{
    switch (type) {
    case fourCC("AIFC"):
        return fourCC("AIFF");
    case fourCC("m4af"):
        return fourCC("M4A ");
    case fourCC("mp4f"):
        return fourCC("mpg4");
    default:
        return type;
    }
}
