#include "media/packets/FLACInfo.h"

#include "media/packets/HighFirstCRC.h"
#include "platform/core/ByteReader.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <bit>
#include <charconv>
#include <optional>
#include <string_view>

namespace platform {

namespace {

/// The channel mask in a comment, which names speakers that are not the usual ones; 0 if there is none.
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

/// The speakers of the file's channels: the usual ones unless a comment says otherwise.
std::uint32_t speakersOfFLAC(HeaderWindow& file, std::uint32_t channels)
{
    constexpr int mostBlocks = 64;
    constexpr std::uint32_t commentsType = 4, most = 1 << 16;
    std::array<std::byte, 4> header;
    std::uint64_t position = 4;
    bool isLast = channels <= 2;
    for (int i = 0; i < mostBlocks && !isLast; ++i) {
        if (!file.get(header, position))
            break;
        const auto fields = loadBE<std::uint32_t>(header.data());
        const std::uint32_t size = fields & 0xFFFFFF;
        isLast = fields >> 31 != 0;
        if ((fields >> 24 & 0x7F) == commentsType && size <= most) {
            Bytes comments(size);
            comments.resize(file.readSome(comments.data(), position + header.size(), size));
            if (const std::uint32_t mask = speakersOfComments(comments); mask != 0)
                return mask;
        }
        position += header.size() + size;
    }
    return usualSpeakersOfFLAC(channels);
}

/// As many bytes as the largest frame has, if the file states that.
Bytes lastBytes(HeaderWindow& file, std::uint32_t largestFrame)
{
    constexpr std::uint32_t usual = 1 << 15, most = 1 << 18;
    const std::uint32_t wanted = std::min(largestFrame == 0 ? usual : largestFrame, most);
    Bytes bytes(static_cast<std::size_t>(std::min<std::uint64_t>(wanted, file.length())));
    bytes.resize(file.readSome(bytes.data(), file.length() - bytes.size(), bytes.size()));
    return bytes;
}

} // namespace

bool flacEndsAt(BytesView tail, std::uint64_t samples, std::uint32_t blockSize)
{
    constexpr std::size_t kSmallestFrame = 10;
    for (std::size_t at = tail.size(); at-- > 0;) {
        const BytesView rest = tail.subspan(at);
        if (rest[0] != std::byte{0xFF} || rest.size() < kSmallestFrame)
            continue;
        const auto frame = parseFLACFrame(rest, blockSize);
        if (frame && frame->first + frame->samples == samples &&
            highFirstCRC<16, 0x8005>(rest) == 0) // the checksum follows the bytes that it covers
            return true;
    }
    return false;
}

std::uint32_t usualSpeakersOfFLAC(std::uint32_t channels)
{
    constexpr std::array<std::uint32_t, 9> usual{0, 0x4, 0x3, 0x7, 0x33, 0x607, 0x60F, 0x70F, 0x63F};
    return channels < usual.size() ? usual[channels] : 0;
}

FLACProperties readFLACProperties(BytesView bytes)
{
    // Bits: smallest and largest block 16 each, smallest and largest frame 24 each, 20 rate, 3 channels - 1, 5 of a
    // sample - 1, 36 frames.
    FLACProperties properties;
    properties.mostInBlock = loadBE<std::uint16_t>(bytes.data() + 2);
    properties.largestFrame = loadBE<std::uint32_t>(bytes.data() + 6) & 0xFFFFFF;
    const auto rest = loadBE<std::uint64_t>(bytes.data() + 10);
    properties.samples = rest & 0xFFFFFFFFF;
    properties.format.formatId = fourCC("flac");
    properties.format.sampleRate = static_cast<double>(rest >> 44);
    properties.format.channelsPerFrame = static_cast<std::uint32_t>(rest >> 41 & 7) + 1;
    properties.format.bitsPerChannel = static_cast<std::uint32_t>(rest >> 36 & 31) + 1;
    return properties;
}

std::int32_t readFLACInfo(HeaderWindow& file, FLACInfo& info)
{
    constexpr std::uint64_t offset = 8;         // after the marker and a block's header
    constexpr std::uint64_t smallestBlock = 10; // bytes
    info = {};
    info.format.formatId = fourCC("flac");
    std::array<std::byte, FLACProperties::kSize> bytes;
    if (!file.get(bytes, offset))
        return file.reason();
    const FLACProperties found = readFLACProperties(bytes);
    info.format = found.format;
    info.speakers = speakersOfFLAC(file, info.format.channelsPerFrame);
    info.statedFrames = found.samples;
    info.frames = std::min(found.samples, file.length() / smallestBlock * found.mostInBlock);
    info.framesAreStated =
        found.samples == 0 || !flacEndsAt(lastBytes(file, found.largestFrame), found.samples, found.mostInBlock);
    return kStatusOK;
}

} // namespace platform
