#include "media/packets/FLACInfo.h"

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

/// The remainder of a division by a polynomial of `width` bits, the highest bit first (RFC 9639, 9.1.8 and 9.3).
template <unsigned width, std::uint32_t polynomial>
std::uint32_t checksum(BytesView bytes)
{
    static constexpr auto table = [] {
        std::array<std::uint32_t, 256> made{};
        for (std::uint32_t value = 0; value < made.size(); ++value) {
            std::uint32_t crc = value << (width - 8);
            for (int bit = 0; bit < 8; ++bit)
                crc = crc << 1 ^ ((crc >> (width - 1) & 1) != 0 ? polynomial : 0);
            made[value] = crc & ((1U << width) - 1);
        }
        return made;
    }();
    std::uint32_t crc = 0;
    for (const std::byte byte : bytes)
        crc = (crc << 8 ^ table[(crc >> (width - 8) ^ std::to_integer<std::uint32_t>(byte)) & 0xFF]) &
              ((1U << width) - 1);
    return crc;
}

/// The number behind the last sample of the frame that begins here; none when no frame does.
std::optional<std::uint64_t> endOfFrame(BytesView bytes, std::uint32_t blockSize)
{
    constexpr std::size_t kMostHeader = 16, kFixedSize = 4;
    bytes = bytes.first(std::min(bytes.size(), kMostHeader));
    if (bytes.size() < kFixedSize + 2)
        return {};
    const auto fixed = loadBE<std::uint32_t>(bytes.data());
    if (fixed >> 17 != 0x7FFC || (fixed & 1) != 0) // sync, a reserved bit of 0; and another one
        return {};
    // Of the frame, or where sizes differ of its first sample, coded like a character in UTF-8.
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
    const std::size_t sizeBytes = code == 6 ? 1 : code == 7 ? 2 : 0;
    const std::uint32_t rate = fixed >> 8 & 15;
    const std::size_t rateBytes = rate == 12 ? 1 : rate == 13 || rate == 14 ? 2 : 0;
    if (code == 0 || rate == 15 || bytes.size() < at + sizeBytes + rateBytes + 1)
        return {};
    const std::uint32_t size = code == 1   ? 192
                               : code <= 5 ? 144U << code
                               : code == 6 ? std::to_integer<std::uint32_t>(bytes[at]) + 1
                               : code == 7 ? loadBE<std::uint16_t>(bytes.data() + at) + 1U
                                           : 1U << code;
    at += sizeBytes + rateBytes;
    if (checksum<8, 0x07>(bytes.first(at)) != std::to_integer<std::uint32_t>(bytes[at]))
        return {};
    const bool countsSamples = (fixed >> 16 & 1) != 0;
    return (countsSamples ? number : number * blockSize) + size;
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
std::uint32_t speakersOfFLAC(HeaderWindow& file, std::uint32_t channels)
{
    constexpr std::array<std::uint32_t, 9> usual{0, 0x4, 0x3, 0x7, 0x33, 0x607, 0x60F, 0x70F, 0x63F};
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
    return usual[channels];
}

/// As many as a frame has at most, where the file says so.
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
        const auto end = endOfFrame(rest, blockSize);
        if (end == samples && checksum<16, 0x8005>(rest) == 0) // with its own checksum behind it
            return true;
    }
    return false;
}

std::int32_t readFLACInfo(HeaderWindow& file, FLACInfo& info)
{
    // Behind the marker, a block header and the smallest number of frames in a block: the largest.
    constexpr std::uint64_t offset = 10;
    constexpr std::uint64_t smallestBlock = 10; // bytes
    info = {};
    info.format.formatId = fourCC("flac");
    std::array<std::byte, 16> bytes;
    if (!file.get(bytes, offset))
        return file.reason();
    const std::uint32_t mostInBlock = loadBE<std::uint16_t>(bytes.data());
    const std::uint32_t largestFrame = loadBE<std::uint32_t>(bytes.data() + 4) & 0xFFFFFF;
    // Bits: 20 rate, 3 channels - 1, 5 of a sample - 1, 36 frames.
    const auto properties = loadBE<std::uint64_t>(bytes.data() + 8);
    const std::uint64_t stated = properties & 0xFFFFFFFFF;
    info.format.sampleRate = static_cast<double>(properties >> 44);
    info.format.channelsPerFrame = static_cast<std::uint32_t>(properties >> 41 & 7) + 1;
    info.format.bitsPerChannel = static_cast<std::uint32_t>(properties >> 36 & 31) + 1;
    info.speakers = speakersOfFLAC(file, info.format.channelsPerFrame);
    info.statedFrames = stated;
    info.frames = std::min(stated, file.length() / smallestBlock * mostInBlock);
    info.framesAreStated = stated == 0 || !flacEndsAt(lastBytes(file, largestFrame), stated, mostInBlock);
    return kStatusOK;
}

} // namespace platform
