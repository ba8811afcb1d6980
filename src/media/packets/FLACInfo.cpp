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

// Codes of block sizes and sample rates in a frame's header (RFC 9639, 9.1.1 and 9.1.2). Some refer to a number of one
// or two bytes, which stands after the frame's own number.

std::size_t bytesOfFLACBlockSize(std::uint32_t code)
{
    switch (code) {
    case 6:
        return 1;
    case 7:
        return 2;
    default:
        return 0;
    }
}

std::uint32_t flacBlockSize(std::uint32_t code, const std::byte* number)
{
    switch (code) {
    case 1:
        return 192;
    case 6:
        return std::to_integer<std::uint32_t>(*number) + 1;
    case 7:
        return loadBE<std::uint16_t>(number) + 1U;
    default:
        return code < 6 ? 144U << code : 1U << code;
    }
}

std::size_t bytesOfFLACRate(std::uint32_t code)
{
    switch (code) {
    case 12:
        return 1;
    case 13:
    case 14:
        return 2;
    default:
        return 0;
    }
}

std::uint32_t flacRate(std::uint32_t code, const std::byte* number)
{
    constexpr std::array<std::uint32_t, 12> rates{0,     88200, 176400, 192000, 8000,  16000,
                                                  22050, 24000, 32000,  44100,  48000, 96000};
    switch (code) {
    case 12:
        return std::to_integer<std::uint32_t>(*number) * 1000;
    case 13:
        return loadBE<std::uint16_t>(number);
    case 14:
        return loadBE<std::uint16_t>(number) * 10U;
    default:
        return rates[code];
    }
}

} // namespace

std::optional<FLACFrame> parseFLACFrame(BytesView bytes, std::uint32_t blockSize)
{
    constexpr std::size_t kMostHeader = 16, kFixedSize = 4;
    constexpr std::array<std::uint32_t, 8> bits{0, 8, 12, 0, 16, 20, 24, 32};
    bytes = bytes.first(std::min(bytes.size(), kMostHeader));
    if (bytes.size() < kFixedSize + 2)
        return {};
    const auto fixed = loadBE<std::uint32_t>(bytes.data());
    if (fixed >> 17 != 0x7FFC || (fixed & 1) != 0) // sync and a reserved 0; a second reserved 0
        return {};
    // Number of the frame, or of its first sample if sizes differ, coded like a character in UTF-8.
    const auto first = std::to_integer<std::uint8_t>(bytes[kFixedSize]);
    const int ones = std::countl_one(first);
    const std::size_t length = ones == 0 ? 1 : static_cast<std::size_t>(ones);
    if (ones == 1 || ones == 8 || bytes.size() < kFixedSize + length + 3)
        return {};
    std::uint64_t number = ones == 0 ? first : first & (0x7FU >> ones);
    std::size_t at = kFixedSize + 1;
    for (; at < kFixedSize + length; ++at)
        number = number << 6 | (std::to_integer<std::uint64_t>(bytes[at]) & 0x3F);
    const std::uint32_t code = fixed >> 12 & 15;
    const std::size_t sizeBytes = bytesOfFLACBlockSize(code);
    const std::uint32_t rate = fixed >> 8 & 15;
    const std::size_t rateBytes = bytesOfFLACRate(rate);
    if (code == 0 || rate == 15 || bytes.size() < at + sizeBytes + rateBytes + 1)
        return {};
    FLACFrame frame;
    frame.samples = flacBlockSize(code, bytes.data() + at);
    at += sizeBytes;
    frame.sampleRate = flacRate(rate, bytes.data() + at);
    at += rateBytes;
    if (highFirstCRC<8, 0x07>(bytes.first(at)) != std::to_integer<std::uint32_t>(bytes[at]))
        return {};
    const bool countsSamples = (fixed >> 16 & 1) != 0;
    frame.first = countsSamples ? number : number * blockSize;
    frame.channels = (fixed >> 4 & 8) != 0 ? 2 : (fixed >> 4 & 7) + 1; // a stereo mode, or independent channels
    frame.bits = bits[fixed >> 1 & 7];
    return frame;
}

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
