// Compressed audio outside the chunked containers. Published source of FLAC: RFC 9639.
#include "audiofile/ContainerDescriptions.h"

#include "media/decoding/CompressedAudio.h"
#include "media/packets/FLACEnd.h"
#include "platform/core/ByteReader.h"

#include <algorithm>
#include <limits>

namespace {

/// Of `info` the fields that all of these have in common.
void setCompressed(AudioFileInfo& info, FourCC fileType, const platform::StreamDescription& format,
                   std::uint64_t frames)
{
    constexpr std::uint64_t most = std::numeric_limits<std::int64_t>::max();
    info.fileType = info.containerId = fileType;
    info.compressed = true;
    info.formatCode = format.formatId;
    info.bitsPerSample = 0;
    info.sourceBits = static_cast<std::int32_t>(std::min<std::uint32_t>(format.bitsPerChannel, 64));
    info.channels = static_cast<std::int32_t>(std::min<std::uint32_t>(format.channelsPerFrame, 0xFFFF));
    info.busFormat = AudioBusFormatForChannels(info.channels);
    SetSampleRate(info, format.sampleRate);
    info.frames = static_cast<std::int64_t>(std::min(frames, most));
}

/// As many as a frame has at most, where the file says so.
Bytes lastBytes(FileWindow& file, std::uint32_t largestFrame)
{
    constexpr std::uint32_t usual = 1 << 15, most = 1 << 18;
    const auto wanted = std::int64_t{std::min(largestFrame == 0 ? usual : largestFrame, most)};
    Bytes bytes(static_cast<std::size_t>(std::min(wanted, file.length())));
    bytes.resize(file.readPieces(bytes.data(), file.length() - static_cast<std::int64_t>(bytes.size()), bytes.size()));
    return bytes;
}

} // namespace

std::int32_t DescribeFLAC(FileWindow& file, AudioFileInfo& info)
{
    // Behind the marker, a block header and the smallest number of frames in a block: the largest.
    constexpr std::int64_t offset = 10;
    constexpr std::uint64_t smallestBlock = 10; // bytes
    std::array<std::byte, 16> bytes{};
    platform::StreamDescription format;
    format.formatId = fourCC("flac");
    if (file.read(bytes.data(), offset, bytes.size()) != kStatusOK) {
        setCompressed(info, fourCC("flac"), format, 0);
        return kStatusEndOfFile;
    }
    const std::uint32_t mostInBlock = loadBE<std::uint16_t>(bytes.data());
    // Bits: 20 rate, 3 channels - 1, 5 of a sample - 1, 36 frames.
    const auto properties = loadBE<std::uint64_t>(bytes.data() + 8);
    const std::uint64_t capacity = static_cast<std::uint64_t>(info.fileLength) / smallestBlock * mostInBlock;
    const std::uint64_t stated = properties & 0xFFFFFFFFF;
    format.sampleRate = static_cast<double>(properties >> 44);
    format.channelsPerFrame = static_cast<std::uint32_t>(properties >> 41 & 7) + 1;
    format.bitsPerChannel = static_cast<std::uint32_t>(properties >> 36 & 31) + 1;
    setCompressed(info, fourCC("flac"), format, std::min(stated, capacity));
    const std::uint32_t largestFrame = loadBE<std::uint32_t>(bytes.data() + 4) & 0xFFFFFF;
    info.framesAreStated = stated == 0 || !platform::flacEndsAt(lastBytes(file, largestFrame), stated, mostInBlock);
    return kStatusOK;
}

std::int32_t DescribeCompressed(const platform::URL& url, BytesView start, AudioFileInfo& info)
{
    platform::CompressedAudio audio;
    const std::int32_t status = platform::describeCompressedAudio(url, start, audio);
    if (audio.fileType != 0 && audio.format.isLinearPCM() && audio.dataOffset > 0) {
        info.fileType = info.containerId = HostFileType(audio.fileType);
        platform::StoredFormat format;
        format.stream = audio.format;
        format.coding = audio.format.formatId;
        SetStoredFormat(info, format);
        SetSampleData(info, static_cast<std::int64_t>(audio.dataOffset), audio.byteCount);
        info.frames = static_cast<std::int64_t>(audio.frames);
    } else if (audio.fileType != 0)
        setCompressed(info, HostFileType(audio.fileType), audio.format, audio.frames);
    return status;
}

FourCC HostFileType(FourCC type)
{
    return type == fourCC("AIFC")   ? fourCC("AIFF")
           : type == fourCC("m4af") ? fourCC("M4A ")
           : type == fourCC("mp4f") ? fourCC("mpg4")
                                    : type;
}
