#include "media/packets/WavPackBlock.h"

#include "platform/core/Packed.h"

#include <array>

namespace platform {

namespace {

/// Checksum over the 16-bit words before its own part.
std::uint32_t checksumOf(BytesView bytes)
{
    std::uint32_t sum = ~0U;
    for (std::size_t at = 0; at + 1 < bytes.size(); at += 2)
        sum = sum * 3 + loadLE<std::uint16_t>(bytes.data() + at);
    return sum;
}

bool isChecksum(BytesView part, std::uint32_t sum)
{
    return part.size() == 4 ? loadLE<std::uint32_t>(part.data()) == sum
                            : part.size() == 2 && loadLE<std::uint16_t>(part.data()) == ((sum ^ sum >> 16) & 0xFFFF);
}

} // namespace

std::optional<WavPackBlock> WavPackBlock::parseHeader(BytesView header)
{
    // "wvpk", size behind these 8 bytes 4, version 2, high bytes of the first frame and of all frames 1 each, all
    // frames 4, first frame 4, frames 4, flags 4, checksum of the samples 4
    constexpr std::uint16_t oldest = 0x402, newest = 0x410;
    constexpr std::uint32_t mono = 0x4, isFloat = 0x80, initial = 0x800, final = 0x1000, dsd = 0x80000000;
    constexpr std::array<std::uint32_t, 16> rates{6000,  8000,  9600,  11025, 12000, 16000, 22050,  24000,
                                                  32000, 44100, 48000, 64000, 88200, 96000, 192000, 0};
    if (header.size() < kHeaderSize || textOf(header.first(4)) != "wvpk")
        return {};
    const auto number = [&](std::size_t at) { return std::uint64_t{loadLE<std::uint32_t>(header.data() + at)}; };
    const auto high = [&](std::size_t at) { return std::to_integer<std::uint64_t>(header[at]) << 32; };
    WavPackBlock block;
    block.size = number(4) + 8;
    const auto version = loadLE<std::uint16_t>(header.data() + 8);
    if (block.size < kHeaderSize || block.size > kMostSize || version < oldest || version > newest)
        return {};
    block.first = number(16) | high(10);
    if (number(12) != 0xFFFFFFFF) // means unknown, so every 2^32 has one number less
        block.total = number(12) + high(11) - (high(11) >> 32);
    block.frames = static_cast<std::uint32_t>(number(20));
    const auto flags = static_cast<std::uint32_t>(number(24));
    const std::uint32_t stored = ((flags & 3) + 1) * 8, unused = flags >> 13 & 31;
    block.bits = (flags & isFloat) != 0 ? 32 : stored > unused ? stored - unused : 0;
    block.sampleRate = rates[flags >> 23 & 15];
    block.isInitial = (flags & initial) != 0;
    block.isFinal = (flags & final) != 0;
    block.isDSD = (flags & dsd) != 0;
    block.channels = (flags & mono) != 0 ? 1 : 2;
    block.speakers = (flags & mono) != 0 ? 0x4 : 0x3;
    return block;
}

std::optional<WavPackBlock> WavPackBlock::parse(BytesView bytes)
{
    std::optional<WavPackBlock> block = parseHeader(bytes);
    return block && block->size == bytes.size() && block->readParts(bytes) ? block : std::nullopt;
}

/// Reads the parts after the header, which must fill the block; the last is the checksum. A part has its kind 1, the
/// number of 16-bit words 1 or 3, and the words, of which the last may be half used.
bool WavPackBlock::readParts(BytesView block)
{
    constexpr unsigned kindMask = 0x3F, isHalfUsed = 0x40, isLarge = 0x80;
    constexpr unsigned channelsKind = 0x0D, sampleRateKind = 0x27, checksumKind = 0x2F;
    const auto byteAt = [&](std::size_t at) { return std::to_integer<std::size_t>(block[at]); };
    for (std::size_t at = kHeaderSize; block.size() - at >= 2;) {
        const std::size_t start = at;
        const std::size_t kind = byteAt(at);
        const std::size_t headerSize = (kind & isLarge) != 0 ? 4 : 2;
        if (block.size() - at < headerSize)
            return false;
        std::size_t words = byteAt(at + 1);
        if (headerSize == 4)
            words += byteAt(at + 2) << 8 | byteAt(at + 3) << 16;
        at += headerSize;
        if (block.size() - at < 2 * words)
            return false;
        const BytesView part = block.subspan(at, 2 * words - ((kind & isHalfUsed) != 0 && words > 0 ? 1 : 0));
        at += 2 * words;
        if ((kind & kindMask) == checksumKind)
            return at == block.size() && isChecksum(part, checksumOf(block.first(start)));
        if ((kind & kindMask) == channelsKind && !readChannels(part))
            return false;
        if ((kind & kindMask) == sampleRateKind) {
            if (part.size() != 3)
                return false;
            sampleRate = loadLE<std::uint16_t>(part.data()) | std::to_integer<std::uint32_t>(part[2]) << 16;
        }
    }
    return false;
}

/// The number of channels and a mask of 1 to 4 bytes; more for over 255 channels.
bool WavPackBlock::readChannels(BytesView part)
{
    if (part.size() < 2 || part.size() > 5)
        return false;
    channels = std::to_integer<std::uint32_t>(part[0]);
    speakers = 0;
    for (std::size_t i = part.size(); i-- > 1;)
        speakers = speakers << 8 | std::to_integer<std::uint32_t>(part[i]);
    return channels > 0;
}

} // namespace platform
