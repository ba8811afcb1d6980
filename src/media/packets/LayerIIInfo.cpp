#include "media/packets/LayerIIInfo.h"

#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <array>

namespace platform {

namespace {

constexpr std::size_t kLayerIIHeaderSize = 4;
constexpr std::uint32_t kLayerIIFrames = 1152;

// Bits: sync 12, MPEG-1 1, layer 2, no CRC 1, bit rate 4, sample rate 2, padding 1, private 1, mode 2, …, emphasis 2
constexpr std::uint32_t kLayerMask = 0xFFF60000, kLayerII = 0xFFF40000;
constexpr std::uint32_t kLayerIIKindMask = 0xFFFE0C00; // sync, version, layer, sample rate
// Further bits: mode, copyright, original, emphasis. A demultiplexer that searches for a stream skips a first frame
// that differs in these from the second.
constexpr std::uint32_t kStartMask = 0xFFFE0CCF;

bool isMono(std::uint32_t header)
{
    return (header >> 6 & 3) == 3;
}

/// 0 if the value is reserved.
std::uint32_t sampleRateOf(std::uint32_t header)
{
    constexpr std::array<std::uint32_t, 4> rates{44100, 48000, 32000, 0};
    const bool isMPEG1 = (header >> 19 & 1) != 0;
    return rates[header >> 10 & 3] / (isMPEG1 ? 1 : 2);
}

/// In bytes; 0 if it is no frame of this layer.
std::uint32_t frameSize(std::uint32_t header)
{
    // Kilobits per second by the header's index: for the half rates of MPEG-2, then for MPEG-1.
    constexpr std::array<std::array<std::uint16_t, 16>, 2> bitRates{
        {{0, 8, 16, 24, 32, 40, 48, 56, 64, 80, 96, 112, 128, 144, 160, 0},
         {0, 32, 48, 56, 64, 80, 96, 112, 128, 160, 192, 224, 256, 320, 384, 0}}};
    const std::uint32_t rate = sampleRateOf(header), bitRate = bitRates[header >> 19 & 1][header >> 12 & 15];
    if ((header & kLayerMask) != kLayerII || rate == 0 || bitRate == 0)
        return 0;
    return kLayerIIFrames / 8 * 1000 * bitRate / rate + (header >> 9 & 1);
}

} // namespace

std::int32_t readLayerIIInfo(PacketFile& file, CompressedAudio& audio)
{
    constexpr std::uint64_t fewest = 16; // frames; a shorter run may be something else
    std::uint32_t first = 0;
    std::uint64_t count = 0, at = 0;
    for (; at < file.length(); ++count) {
        const BytesView bytes = file.at(at, kLayerIIHeaderSize);
        const std::uint32_t header = bytes.size() == kLayerIIHeaderSize ? loadBE<std::uint32_t>(bytes.data()) : 0;
        const std::uint32_t size = frameSize(header);
        first = count == 0 ? header : first;
        const std::uint32_t alike = count == 1 ? kStartMask : kLayerIIKindMask;
        if (size == 0 || ((header ^ first) & alike) != 0 || isMono(header) != isMono(first))
            return file.takeStatus(false);
        at += size;
    }
    if (at != file.length() || count < fewest)
        return file.takeStatus(false);
    audio = {};
    audio.fileType = fourCC("MPG2");
    audio.format.formatId = fourCC(".mp2");
    audio.format.sampleRate = sampleRateOf(first);
    audio.format.channelsPerFrame = isMono(first) ? 1 : 2;
    audio.format.framesPerPacket = kLayerIIFrames;
    audio.frames = count * kLayerIIFrames;
    audio.facts.speakers = isMono(first) ? 0x4 : 0x3;
    return kStatusOK;
}

} // namespace platform
