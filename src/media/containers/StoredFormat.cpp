#include "media/containers/StoredFormat.h"

#include "media/containers/ExtendedFloat.h"
#include "platform/core/ByteReader.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace platform {

namespace {

using Flag = StreamDescription::Flag;

enum : std::uint16_t {
    kTagPCM = 0x0001,
    kTagADPCM = 0x0002,
    kTagFloat = 0x0003,
    kTagALaw = 0x0006,
    kTagMuLaw = 0x0007,
    kTagIMAADPCM = 0x0011,
    kTagExtensible = 0xFFFE,
};

// The bytes after the tag in sub-format GUIDs that stand for a tag: the general GUID, and that of Ambisonic files.
constexpr std::array<std::uint8_t, 14> kTagGUID{0x00, 0x00, 0x00, 0x00, 0x10, 0x00, 0x80,
                                                0x00, 0x00, 0xAA, 0x00, 0x38, 0x9B, 0x71};
constexpr std::array<std::uint8_t, 14> kAmbisonicGUID{0x00, 0x00, 0x21, 0x07, 0xD3, 0x11, 0x86,
                                                      0x44, 0xC8, 0xC1, 0xCA, 0x00, 0x00, 0x00};

/// Bytes per sample. A sample's share of the frame decides, as with 20 bits in 3 bytes or 24 in 4, unless it is
/// impossible. A float fills its bytes.
std::uint32_t sampleBytes(std::uint32_t bits, std::uint32_t bytesPerFrame, std::uint32_t channels, bool isFloat)
{
    const std::uint32_t fromBits = bits / 8 + (bits % 8 != 0 ? 1 : 0);
    const std::uint32_t fromFrame = channels > 0 && bytesPerFrame % channels == 0 ? bytesPerFrame / channels : 0;
    if (isFloat && (fromBits == 4 || fromBits == 8))
        return fromBits;
    return fromFrame >= fromBits && fromFrame <= (isFloat ? 8U : 4U) ? fromFrame : fromBits;
}

struct Linear {
    std::uint32_t bytesPerSample = 0;
    bool isFloat = false;
    bool isBigEndian = false;
    bool isUnsigned = false;
};

void setLinear(StoredFormat& format, const Linear& linear)
{
    StreamDescription& stream = format.stream;
    constexpr std::uint32_t most = 9; // bytes per sample; above 8 the samples cannot be read anyway
    const std::uint32_t bytes = std::min(linear.bytesPerSample, most);
    format.coding = stream.formatId = StreamDescription::linearPCM;
    stream.formatFlags = (linear.isFloat      ? Flag::isFloat
                          : linear.isUnsigned ? 0U
                                              : Flag::isSignedInteger) |
                         (linear.isBigEndian ? Flag::isBigEndian : 0U);
    if (stream.bitsPerChannel == 0 || stream.bitsPerChannel > bytes * 8 || linear.isFloat)
        stream.bitsPerChannel = bytes * 8;
    if (stream.bitsPerChannel == bytes * 8)
        stream.formatFlags |= Flag::isPacked;
    stream.framesPerPacket = 1;
    const std::uint64_t frame = std::uint64_t{bytes} * stream.channelsPerFrame;
    stream.bytesPerFrame = stream.bytesPerPacket =
        static_cast<std::uint32_t>(std::min<std::uint64_t>(frame, UINT32_MAX));
}

} // namespace

std::optional<StoredFormat> storedFormatOfWAVE(BytesView bytes, std::endian order)
{
    constexpr std::size_t plainSize = 16;
    if (bytes.size() < plainSize - 2) // the oldest writers omit the bits
        return std::nullopt;
    std::array<std::byte, kMostOfStoredFormat> body{};
    const std::size_t there = std::min(bytes.size(), body.size());
    std::copy_n(bytes.begin(), there, body.begin());
    ByteReader reader(body, order);
    StoredFormat format;
    StreamDescription& stream = format.stream;
    auto tag = reader.read<std::uint16_t>();
    stream.channelsPerFrame = reader.read<std::uint16_t>();
    stream.sampleRate = reader.read<std::uint32_t>();
    reader.skip(4); // bytes per second
    const auto blockAlign = reader.read<std::uint16_t>();
    stream.bitsPerChannel = reader.read<std::uint16_t>();
    reader.skip(2);                                           // size of the rest, which the chunk's own size tells too
    const auto framesPerBlock = reader.read<std::uint16_t>(); // for ADPCM; valid bits for extensible formats
    if (tag == kTagExtensible && there == body.size()) {
        format.validBits = framesPerBlock <= stream.bitsPerChannel ? framesPerBlock : 0U;
        format.speakers = reader.read<std::uint32_t>();
        const auto stated = reader.read<std::uint16_t>();
        const BytesView guid = reader.take(kTagGUID.size());
        const auto is = [&](const auto& known) { return std::ranges::equal(guid, std::as_bytes(std::span(known))); };
        if (is(kTagGUID) || is(kAmbisonicGUID))
            tag = stated;
    }
    if (tag == kTagPCM || tag == kTagFloat) {
        const bool isFloat = tag == kTagFloat;
        const std::uint32_t size = sampleBytes(stream.bitsPerChannel, blockAlign, stream.channelsPerFrame, isFloat);
        setLinear(format, {.bytesPerSample = size,
                           .isFloat = isFloat,
                           .isBigEndian = order == std::endian::big,
                           .isUnsigned = size == 1 && !isFloat});
        return format;
    }
    const bool isADPCM = tag == kTagADPCM || tag == kTagIMAADPCM;
    const bool isCompanded = tag == kTagALaw || tag == kTagMuLaw;
    format.coding = fourCC('m', 's', 0, 0) | tag;
    stream.formatId = tag == kTagALaw ? fourCC("alaw") : tag == kTagMuLaw ? fourCC("ulaw") : format.coding;
    stream.bytesPerPacket = isCompanded ? stream.channelsPerFrame : blockAlign;
    stream.framesPerPacket = isCompanded ? 1U : isADPCM ? framesPerBlock : 0U;
    return format;
}

std::optional<StoredFormat> storedFormatOfAIFF(BytesView bytes, bool isAIFC)
{
    constexpr std::size_t plainSize = 18;
    // The compression types that are linear PCM. 0 bytes: as many as the chunk's bits need.
    struct LinearType {
        FourCC type;
        Linear linear;
    };
    static constexpr LinearType linearTypes[] = {
        {fourCC("NONE"), {.isBigEndian = true}},
        {fourCC("twos"), {.isBigEndian = true}},
        {fourCC("sowt"), {}},
        {fourCC("raw "), {.bytesPerSample = 1, .isBigEndian = true, .isUnsigned = true}},
        {fourCC("in16"), {.bytesPerSample = 2, .isBigEndian = true}},
        {fourCC("in24"), {.bytesPerSample = 3, .isBigEndian = true}},
        {fourCC("in32"), {.bytesPerSample = 4, .isBigEndian = true}},
        {fourCC("42ni"), {.bytesPerSample = 3}},
        {fourCC("42n1"), {.bytesPerSample = 3}},
        {fourCC("ni24"), {.bytesPerSample = 3}},
        {fourCC("23ni"), {.bytesPerSample = 4}},
        {fourCC("ni32"), {.bytesPerSample = 4}},
        {fourCC("fl32"), {.bytesPerSample = 4, .isFloat = true, .isBigEndian = true}},
        {fourCC("FL32"), {.bytesPerSample = 4, .isFloat = true, .isBigEndian = true}},
        {fourCC("fl64"), {.bytesPerSample = 8, .isFloat = true, .isBigEndian = true}},
        {fourCC("FL64"), {.bytesPerSample = 8, .isFloat = true, .isBigEndian = true}},
    };
    struct PacketType {
        FourCC type, id;
        std::uint32_t bytes, frames; // bytes per channel
    };
    static constexpr PacketType packetTypes[] = {
        {fourCC("alaw"), fourCC("alaw"), 1, 1},   {fourCC("ALAW"), fourCC("alaw"), 1, 1},
        {fourCC("ulaw"), fourCC("ulaw"), 1, 1},   {fourCC("ULAW"), fourCC("ulaw"), 1, 1},
        {fourCC("ima4"), fourCC("ima4"), 34, 64}, {fourCC("MAC3"), fourCC("MAC3"), 2, 6},
        {fourCC("MAC6"), fourCC("MAC6"), 1, 6},
    };
    if (bytes.size() < plainSize)
        return std::nullopt;
    ByteReader reader(bytes);
    StoredFormat format;
    StreamDescription& stream = format.stream;
    stream.channelsPerFrame = static_cast<std::uint32_t>(std::max<int>(reader.read<std::int16_t>(), 0));
    format.countedPackets = reader.read<std::uint32_t>();
    stream.bitsPerChannel = static_cast<std::uint32_t>(std::max<int>(reader.read<std::int16_t>(), 0));
    stream.sampleRate = loadExtended(reader.take(kExtendedSize).data());
    FourCC type = fourCC("NONE");
    if (isAIFC && bytes.size() >= plainSize + sizeof(FourCC))
        type = reader.readFourCC();
    if (const auto* const linear = std::ranges::find(linearTypes, type, &LinearType::type);
        linear != std::end(linearTypes)) {
        Linear stated = linear->linear;
        if (stated.bytesPerSample == 0)
            stated.bytesPerSample = (stream.bitsPerChannel + 7) / 8;
        else if (stated.isFloat || stream.bitsPerChannel > stated.bytesPerSample * 8)
            stream.bitsPerChannel = stated.bytesPerSample * 8;
        setLinear(format, stated);
        return format;
    }
    format.coding = stream.formatId = type;
    if (const auto* const packets = std::ranges::find(packetTypes, type, &PacketType::type);
        packets != std::end(packetTypes)) {
        stream.formatId = packets->id;
        stream.bytesPerPacket = packets->bytes * stream.channelsPerFrame;
        stream.framesPerPacket = packets->frames;
    }
    return format;
}

std::optional<StoredFormat> storedFormatOfCAF(BytesView bytes)
{
    constexpr std::size_t size = 32;
    constexpr std::uint32_t kFloat = 1, kLittleEndian = 2; // flags of linear PCM
    if (bytes.size() < size)
        return std::nullopt;
    ByteReader reader(bytes);
    StoredFormat format;
    StreamDescription& stream = format.stream;
    const auto rate = reader.read<double>();
    stream.sampleRate = std::isfinite(rate) ? std::max(rate, 0.0) : 0;
    format.coding = stream.formatId = reader.readFourCC();
    const auto flags = reader.read<std::uint32_t>();
    stream.bytesPerPacket = reader.read<std::uint32_t>();
    stream.framesPerPacket = reader.read<std::uint32_t>();
    stream.channelsPerFrame = reader.read<std::uint32_t>();
    stream.bitsPerChannel = reader.read<std::uint32_t>();
    if (stream.formatId == StreamDescription::linearPCM) {
        const bool isFloat = (flags & kFloat) != 0;
        const std::uint32_t bytesPerFrame = stream.bytesPerPacket / std::max(stream.framesPerPacket, 1U);
        setLinear(format, {.bytesPerSample =
                               sampleBytes(stream.bitsPerChannel, bytesPerFrame, stream.channelsPerFrame, isFloat),
                           .isFloat = isFloat,
                           .isBigEndian = (flags & kLittleEndian) == 0});
    }
    return format;
}

std::optional<StoredFormat> storedFormatOfAU(BytesView bytes)
{
    constexpr std::size_t size = 24, encodingOffset = 12;
    constexpr std::uint32_t muLaw = 1, aLaw = 27;
    static constexpr std::array<Linear, 6> linearEncodings{
        {{.bytesPerSample = 1, .isBigEndian = true}, // version 2 on
         {.bytesPerSample = 2, .isBigEndian = true},
         {.bytesPerSample = 3, .isBigEndian = true},
         {.bytesPerSample = 4, .isBigEndian = true},
         {.bytesPerSample = 4, .isFloat = true, .isBigEndian = true},
         {.bytesPerSample = 8, .isFloat = true, .isBigEndian = true}}};
    if (bytes.size() < size)
        return std::nullopt;
    ByteReader reader(bytes.subspan(encodingOffset));
    StoredFormat format;
    StreamDescription& stream = format.stream;
    const auto encoding = reader.read<std::uint32_t>();
    stream.sampleRate = reader.read<std::uint32_t>();
    stream.channelsPerFrame = reader.read<std::uint32_t>();
    if (encoding >= 2 && encoding - 2 < linearEncodings.size()) {
        setLinear(format, linearEncodings[encoding - 2]);
        return format;
    }
    stream.formatId = encoding == muLaw  ? fourCC("ulaw")
                      : encoding == aLaw ? fourCC("alaw")
                                         : fourCC('a', 'u', 0, 0) | (encoding & 0xFFFF);
    format.coding = stream.formatId;
    if (encoding == muLaw || encoding == aLaw) {
        stream.bytesPerPacket = stream.channelsPerFrame;
        stream.framesPerPacket = 1;
    }
    return format;
}

bool isUnfinished(ContainerKind kind, const SoundChunk& chunk)
{
    if (kind == ContainerKind::caf)
        return chunk.size <= 0;
    const std::int64_t lead = kind == ContainerKind::iff ? 8 : 0;
    const bool endsAhead = chunk.containerSize <= static_cast<std::int64_t>(chunk.body) + lead - 8;
    return chunk.isOpen || (chunk.size >= 0 && chunk.size <= lead && endsAhead);
}

std::uint64_t soundDataLead(std::uint64_t size, BytesView start)
{
    constexpr std::uint64_t fixedSize = 8;
    if (size < fixedSize || start.size() < 4)
        return std::min(size, fixedSize);
    const std::uint64_t offset = loadBE<std::uint32_t>(start.data());
    return fixedSize + (offset <= size - fixedSize ? offset : 0);
}

} // namespace platform
