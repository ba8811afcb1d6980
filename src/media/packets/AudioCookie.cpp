#include "media/packets/AudioCookie.h"

#include "media/containers/AudioHandle.h"
#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform {

namespace {

constexpr std::array<std::uint32_t, 13> kSampleRates = {96000, 88200, 64000, 48000, 44100, 32000, 24000,
                                                        22050, 16000, 12000, 11025, 8000,  7350};
constexpr std::array<std::uint8_t, 8> kChannels = {0, 1, 2, 3, 4, 5, 6, 8}; // indexed by channel configuration
constexpr std::uint32_t kLowComplexity = 2;
constexpr std::uint32_t kBandReplication = 5;
constexpr std::uint32_t kSyncExtension = 0x2B7;
constexpr std::uint32_t kHighestReplicatedRate = 24000; // that encoders make; decoding doubles it

/// Reads numbers of any number of bits; zeros after the end.
class BitReader {
public:
    explicit BitReader(BytesView bytes) : bytes_(bytes) {}

    std::uint32_t read(unsigned count)
    {
        std::uint32_t value = 0;
        for (; count > 0; --count, ++position_) {
            const std::size_t byte = position_ / 8;
            const unsigned bit =
                byte < bytes_.size() ? std::to_integer<unsigned>(bytes_[byte]) >> (7 - position_ % 8) & 1 : 0;
            value = value << 1 | bit;
        }
        return value;
    }
    bool has(std::size_t count) const { return position_ + count <= bytes_.size() * 8; }

private:
    BytesView bytes_;
    std::size_t position_ = 0; // bits
};

/// The body of the next descriptor if it has this tag.
BytesView takeDescriptor(ByteReader& reader, std::uint8_t tag)
{
    if (reader.read<std::uint8_t>() != tag)
        return {};
    std::size_t size = 0;
    for (int i = 0; i < 4; ++i) {
        const auto part = reader.read<std::uint8_t>();
        size = size << 7 | (part & 0x7F);
        if (part < 0x80)
            break;
    }
    return reader.take(std::min(size, reader.remaining())); // the enclosing size may be too small
}

} // namespace

std::int32_t readAACCookie(Bytes& cookie, StreamDescription& format)
{
    BitReader bits(cookie);
    const std::uint32_t objectType = bits.read(5);
    const std::uint32_t rateIndex = bits.read(4);
    if (objectType != kLowComplexity || (rateIndex >= kSampleRates.size() && rateIndex != 15))
        return AudioHandle::kFormatNotSupported;
    const std::uint32_t rate = rateIndex == 15 ? bits.read(24) : kSampleRates[rateIndex];
    const std::uint32_t channels = bits.read(4);
    const bool isShort = bits.read(1) != 0;
    const bool dependsOnCore = bits.read(1) != 0;
    const bool isExtended = bits.read(1) != 0;
    const bool isWhole = bits.has(0);
    const bool isExplicit = bits.has(17) && bits.read(11) == kSyncExtension && bits.read(5) == kBandReplication;
    const bool isReplicated = isExplicit ? bits.read(1) != 0 : rate <= kHighestReplicatedRate;
    if (!isWhole || rate == 0 || channels == 0 || channels >= kChannels.size() || dependsOnCore || isExtended ||
        isReplicated)
        return AudioHandle::kFormatNotSupported;
    format.sampleRate = rate;
    format.channelsPerFrame = kChannels[channels];
    format.framesPerPacket = isShort ? 960 : 1024;
    return kStatusOK;
}

std::int32_t readESDescriptor(Bytes& cookie, StreamDescription& format)
{
    enum : std::uint8_t { esTag = 3, decoderTag = 4, specificTag = 5 };
    enum : std::uint8_t { dependsOnStream = 0x80, hasURL = 0x40, hasClock = 0x20 };
    constexpr std::array<std::uint8_t, 2> kAACObjects = {0x40, 0x67}; // MPEG-4, and MPEG-2 low complexity
    ByteReader reader(cookie);
    ByteReader stream(takeDescriptor(reader, esTag));
    stream.skip(2); // id
    const auto flags = stream.read<std::uint8_t>();
    stream.skip(flags & dependsOnStream ? 2 : 0);
    stream.skip(flags & hasURL ? stream.read<std::uint8_t>() : 0);
    stream.skip(flags & hasClock ? 2 : 0);
    ByteReader decoder(takeDescriptor(stream, decoderTag));
    const auto object = decoder.read<std::uint8_t>();
    decoder.skip(12); // stream type 1, buffer 3, bit rates 4 + 4
    const BytesView specific = takeDescriptor(decoder, specificTag);
    if (specific.empty() || std::ranges::find(kAACObjects, object) == kAACObjects.end())
        return AudioHandle::kFormatNotSupported;
    cookie = Bytes(specific.begin(), specific.end());
    return readAACCookie(cookie, format);
}

std::int32_t readALACCookie(Bytes& cookie, StreamDescription& format)
{
    constexpr std::size_t kSize = 24;
    constexpr std::uint32_t kMostFrames = 16384; // per packet; more would exceed any decoder
    if (cookie.size() < kSize)
        return kStatusIOError;
    ByteReader reader(cookie);
    format.framesPerPacket = reader.read<std::uint32_t>();
    const auto version = reader.read<std::uint8_t>();
    format.bitsPerChannel = reader.read<std::uint8_t>();
    reader.skip(3); // coding parameters
    format.channelsPerFrame = reader.read<std::uint8_t>();
    reader.skip(10); // longest run 2, largest packet 4, bit rate 4
    format.sampleRate = reader.read<std::uint32_t>();
    const std::uint32_t bits = format.bitsPerChannel;
    if (version != 0)
        return AudioHandle::kFormatNotSupported;
    const bool isSound = format.framesPerPacket > 0 && format.framesPerPacket <= kMostFrames &&
                         (bits == 16 || bits == 20 || bits == 24 || bits == 32) && format.channelsPerFrame >= 1 &&
                         format.channelsPerFrame <= 8 && format.sampleRate > 0;
    return isSound ? kStatusOK : kStatusIOError;
}

SoundFacts factsOfCookie(const StreamDescription& format)
{
    // Indexed by the number of channels. For eight, AAC names the inner front pair, 0xFF, but its encoders mean the
    // usual eight speakers, and decoders agree.
    constexpr std::array<std::uint32_t, 9> aac{0, 0x4, 0x3, 0x7, 0x107, 0x37, 0x3F, 0, 0x63F};
    constexpr std::array<std::uint32_t, 9> alac{0, 0x4, 0x3, 0x7, 0x107, 0x37, 0x3F, 0x13F, 0xFF};
    SoundFacts facts;
    const bool isAAC = format.formatId == fourCC("aac ");
    if ((isAAC || format.formatId == fourCC("alac")) && format.channelsPerFrame < aac.size())
        facts.speakers = (isAAC ? aac : alac)[format.channelsPerFrame];
    if (isAAC)
        facts.profile = CodingProfile::aacLC; // readAACCookie accepts nothing else
    return facts;
}

std::uint32_t framesOfALACPacket(BytesView packet, std::uint32_t framesPerPacket)
{
    enum : std::uint32_t { singleChannel = 0, channelPair = 1, lowFrequencies = 3 };
    BitReader bits(packet);
    const std::uint32_t element = bits.read(3);
    bits.read(4 + 12); // element instance tag, unused bits
    const bool isPartial = bits.read(1) != 0;
    bits.read(2 + 1); // shift, "not compressed" flag
    const bool isSound = element == singleChannel || element == channelPair || element == lowFrequencies;
    if (!isSound || !isPartial || !bits.has(32))
        return framesPerPacket;
    return std::min(bits.read(32), framesPerPacket);
}

Bytes makeAACCookie(std::uint32_t rateIndex, std::uint32_t channelConfiguration)
{
    const std::uint32_t first = kLowComplexity << 11 | rateIndex << 7 | channelConfiguration << 3;
    const std::uint32_t extension = kSyncExtension << 13 | kBandReplication << 8; // and a 0 bit, which rules it out
    Bytes cookie(5);
    storeBE(cookie.data(), static_cast<std::uint16_t>(first));
    storeBE(cookie.data() + 2, static_cast<std::uint16_t>(extension >> 8));
    return cookie;
}

} // namespace platform
