#include "media/packets/AC3Info.h"

#include "media/packets/HighFirstCRC.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform {

namespace {

constexpr std::size_t kHeaderSize = 8;
constexpr std::uint64_t kFramesInOne = 1536;

/// The first bytes of a frame. Bits: sync 16, checksum 16, sample rate 2, frame size 6, version 5, service 3, channels
/// 3, then 2 each for the mix of a centre, the mix of surrounds and the kind of stereo, as far as they apply, low
/// frequencies 1.
struct Header {
    std::uint32_t size = 0; // bytes of the frame
    std::uint32_t sampleRate = 0;
    std::uint32_t speakers = 0; // as bits of WAVE's channel mask
    std::uint32_t channels = 0;

    bool isOfOneKind(const Header& other) const
    {
        return sampleRate == other.sampleRate && speakers == other.speakers && channels == other.channels;
    }
};

/// Size 0 if the bytes begin no frame.
Header parse(BytesView bytes)
{
    constexpr std::array<std::uint32_t, 19> bitRates{32,  40,  48,  56,  64,  80,  96,  112, 128, 160,
                                                     192, 224, 256, 320, 384, 448, 512, 576, 640};
    constexpr std::array<std::uint32_t, 3> sampleRates{48000, 44100, 32000};
    constexpr std::array<std::uint32_t, 8> speakers{0x3, 0x4, 0x3, 0x7, 0x103, 0x107, 0x603, 0x607};
    constexpr std::array<std::uint32_t, 8> channels{2, 1, 2, 3, 3, 4, 4, 5};
    constexpr std::uint32_t newest = 8, lowFrequencies = 0x8;
    Header header;
    if (bytes.size() < kHeaderSize || loadBE<std::uint16_t>(bytes.data()) != 0x0B77)
        return header;
    const auto fields = loadBE<std::uint32_t>(bytes.data() + 4);
    const std::uint32_t rate = fields >> 30, size = fields >> 24 & 63, version = fields >> 19 & 31;
    const std::uint32_t mode = fields >> 13 & 7;
    if (rate >= sampleRates.size() || size / 2 >= bitRates.size() || version > newest)
        return header;
    const bool hasCentre = (mode & 1) != 0 && mode != 1, hasSurrounds = (mode & 4) != 0, isStereo = mode == 2;
    const int skipped = 2 * (int{hasCentre} + int{hasSurrounds} + int{isStereo});
    const bool hasLowFrequencies = (fields >> (12 - skipped) & 1) != 0;
    header.sampleRate = sampleRates[rate];
    header.speakers = speakers[mode] | (hasLowFrequencies ? lowFrequencies : 0);
    header.channels = channels[mode] + (hasLowFrequencies ? 1 : 0);
    // In 16-bit words; at 44.1 kHz an odd code has one more.
    const std::uint32_t words =
        static_cast<std::uint32_t>(kFramesInOne * 1000 / 16 * bitRates[size / 2] / header.sampleRate);
    header.size = 2 * (words + (rate == 1 ? size & 1 : 0));
    return header;
}

bool isWhole(BytesView frame)
{
    return highFirstCRC<16, 0x8005>(frame.subspan(2)) == 0;
}

} // namespace

std::int32_t readAC3Info(PacketFile& file, CompressedAudio& audio)
{
    constexpr std::uint64_t fewest = 16; // frames; a shorter run may be something else
    constexpr std::size_t proven = 4;
    Header first;
    std::array<std::uint64_t, proven> last{}; // positions
    std::uint64_t count = 0, at = 0;
    const auto isFrameWhole = [&](std::uint64_t position) {
        const std::uint32_t size = parse(file.at(position, kHeaderSize)).size;
        const BytesView frame = file.at(position, size);
        return size > 2 && frame.size() == size && isWhole(frame);
    };
    for (; at < file.length(); ++count) {
        const Header header = parse(file.at(at, kHeaderSize));
        first = count == 0 ? header : first;
        if (header.size == 0 || !header.isOfOneKind(first))
            return file.takeStatus(false);
        last[count % proven] = at;
        at += header.size;
    }
    const bool isProven = at == file.length() && count >= fewest && isFrameWhole(0) &&
                          std::all_of(last.begin(), last.end(), isFrameWhole);
    if (!isProven)
        return file.takeStatus(false);
    audio = {};
    audio.fileType = audio.format.formatId = fourCC("ac-3");
    audio.format.sampleRate = first.sampleRate;
    audio.format.channelsPerFrame = first.channels;
    audio.frames = count * kFramesInOne;
    audio.facts.speakers = first.speakers;
    return kStatusOK;
}

} // namespace platform
