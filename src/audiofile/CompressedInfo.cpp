// Compressed audio outside the chunked containers. Published source of FLAC: RFC 9639.
#include "audiofile/ContainerDescriptions.h"

#include "media/decoding/CompressedAudio.h"
#include "media/packets/FLACEnd.h"
#include "platform/core/ByteReader.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <string_view>

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
    const bool isLossy = format.bytesPerPacket > 0 && !format.isLinearPCM(); // whose bits are those of its codes
    info.sourceBits = isLossy ? 0 : static_cast<std::int32_t>(std::min<std::uint32_t>(format.bitsPerChannel, 64));
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

/// The mask in a comment that names the speakers of channels which are not the usual ones; 0 without it.
std::uint32_t speakersOfComments(BytesView comments)
{
    constexpr std::string_view key = "WAVEFORMATEXTENSIBLE_CHANNEL_MASK=0x";
    const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; };
    const auto isSameLetter = [&](char a, char b) { return lower(a) == lower(b); };
    ByteReader reader(comments, std::endian::little);
    reader.skip(reader.read<std::uint32_t>()); // the encoder's name
    for (auto count = reader.read<std::uint32_t>(); count > 0 && reader.ok(); --count) {
        const std::string_view comment = textOf(reader.take(reader.read<std::uint32_t>()));
        const bool isKey =
            comment.size() > key.size() && std::equal(key.begin(), key.end(), comment.begin(), isSameLetter);
        std::uint32_t mask = 0;
        if (isKey)
            std::from_chars(comment.data() + key.size(), comment.data() + comment.size(), mask, 16);
        if (mask != 0)
            return mask;
    }
    return 0;
}

/// Which speakers FLAC's channels feed: the usual ones of so many, if no comment says otherwise.
std::uint32_t speakersOfFLAC(FileWindow& file, std::uint32_t channels)
{
    constexpr std::array<std::uint32_t, 9> usual{0, 0x4, 0x3, 0x7, 0x33, 0x607, 0x60F, 0x70F, 0x63F};
    constexpr int mostBlocks = 64;
    constexpr std::uint32_t commentsType = 4, most = 1 << 16;
    std::array<std::byte, 4> header{};
    std::int64_t position = 4;
    bool isLast = channels <= 2;
    for (int i = 0; i < mostBlocks && !isLast; ++i) {
        if (file.read(header.data(), position, header.size()) != kStatusOK)
            break;
        const auto fields = loadBE<std::uint32_t>(header.data());
        const std::uint32_t size = fields & 0xFFFFFF;
        isLast = fields >> 31 != 0;
        if ((fields >> 24 & 0x7F) == commentsType && size <= most) {
            Bytes comments(size);
            comments.resize(file.readPieces(comments.data(), position + std::int64_t{header.size()}, size));
            if (const std::uint32_t mask = speakersOfComments(comments); mask != 0)
                return mask;
        }
        position += std::int64_t{header.size()} + size;
    }
    return usual[channels];
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
    info.speakers = speakersOfFLAC(file, format.channelsPerFrame);
    info.promisedFrames = static_cast<std::int64_t>(stated); // if the decoder finds fewer
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
    } else if (audio.fileType != 0) {
        setCompressed(info, HostFileType(audio.fileType), audio.format, audio.frames);
        SetSoundFacts(info, audio.facts);
    }
    return status;
}

FourCC HostFileType(FourCC type)
{
    return type == fourCC("AIFC")   ? fourCC("AIFF")
           : type == fourCC("m4af") ? fourCC("M4A ")
           : type == fourCC("mp4f") ? fourCC("mpg4")
                                    : type;
}
