#include "platform/audio/AudioDescription.h"

#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

using Flag = StreamDescription::Flag;

/// The first bytes of a chunk's body, at most `most`; empty when it has fewer than `least`.
Bytes bodyOf(const BodyReader& readBody, const Chunk* chunk, std::size_t least, std::size_t most)
{
    if (chunk == nullptr || chunk->size < least)
        return {};
    Bytes body(static_cast<std::size_t>(std::min<std::uint64_t>(chunk->size, most)));
    if (readBody(*chunk, body.data(), body.size()) != kStatusOK)
        return {};
    return body;
}

void setLinearPCM(StreamDescription& format, bool isFloat, bool isBigEndian, bool isSigned)
{
    format.formatId = StreamDescription::linearPCM;
    format.formatFlags = (isFloat    ? Flag::isFloat
                          : isSigned ? Flag::isSignedInteger
                                     : 0u) |
                         (isBigEndian ? Flag::isBigEndian : 0u);
    format.framesPerPacket = 1;
    const std::uint64_t packed = std::uint64_t{format.bitsPerChannel} * format.channelsPerFrame;
    if (format.bitsPerChannel % 8 == 0 && packed == std::uint64_t{format.bytesPerFrame} * 8)
        format.formatFlags |= Flag::isPacked;
    format.bytesPerPacket = format.bytesPerFrame;
}

std::int32_t describeWAVE(const BodyReader& readBody, const ContainerLayout& layout, StreamDescription& format)
{
    const Bytes body = bodyOf(readBody, layout.find(fourCC("fmt ")), 16, 40);
    if (body.empty())
        return kStatusIOError;
    ByteReader reader(body, std::endian::little);
    auto tag = reader.read<std::uint16_t>();
    format.channelsPerFrame = reader.read<std::uint16_t>();
    format.sampleRate = reader.read<std::uint32_t>();
    reader.skip(4); // bytes per second
    const std::uint32_t blockAlign = reader.read<std::uint16_t>();
    format.bitsPerChannel = reader.read<std::uint16_t>();
    const auto extraSize = reader.read<std::uint16_t>();
    const auto samplesPerBlock = reader.read<std::uint16_t>();
    if (tag == 0xFFFE && extraSize >= 22 && body.size() >= 26)
        tag = loadLE<std::uint16_t>(body.data() + 24); // the sub-format begins with the tag
    if (tag == 1 || tag == 3) {
        format.bytesPerFrame = blockAlign;
        setLinearPCM(format, tag == 3, false, format.bitsPerChannel > 8);
        return kStatusOK;
    }
    const bool isCompanded = tag == 6 || tag == 7;
    const bool isADPCM = (tag == 2 || tag == 0x11) && extraSize >= 2;
    format.formatId = tag == 6 ? fourCC("alaw") : tag == 7 ? fourCC("ulaw") : fourCC('m', 's', 0, 0) | tag;
    format.bytesPerPacket = blockAlign;
    format.framesPerPacket = isCompanded ? 1u : isADPCM ? samplesPerBlock : 0u;
    return kStatusOK;
}

/// The coding of an AIFC file.
void setAIFCFormat(StreamDescription& format, FourCC compression)
{
    struct Coding {
        FourCC compression;
        std::uint32_t bits; // 0: as stated
        bool isFloat, isBigEndian, isSigned;
    };
    static constexpr Coding codings[] = {
        {fourCC("NONE"), 0, false, true, true},  {fourCC("twos"), 0, false, true, true},
        {fourCC("sowt"), 0, false, false, true}, {fourCC("in16"), 16, false, true, true},
        {fourCC("in24"), 24, false, true, true}, {fourCC("in32"), 32, false, true, true},
        {fourCC("raw "), 8, false, true, false}, {fourCC("fl32"), 32, true, true, true},
        {fourCC("FL32"), 32, true, true, true},  {fourCC("fl64"), 64, true, true, true},
        {fourCC("FL64"), 64, true, true, true},
    };
    const auto coding = std::ranges::find(codings, compression, &Coding::compression);
    if (coding != std::end(codings)) {
        if (coding->bits != 0)
            format.bitsPerChannel = coding->bits;
        format.bytesPerFrame = (format.bitsPerChannel + 7) / 8 * format.channelsPerFrame;
        return setLinearPCM(format, coding->isFloat, coding->isBigEndian, coding->isSigned);
    }
    format.formatId = compression == fourCC("ALAW")   ? fourCC("alaw")
                      : compression == fourCC("ULAW") ? fourCC("ulaw")
                                                      : compression;
    const bool isCompanded = format.formatId == fourCC("alaw") || format.formatId == fourCC("ulaw");
    const bool isIMA4 = format.formatId == fourCC("ima4");
    format.bytesPerPacket = (isCompanded ? 1u : isIMA4 ? 34u : 0u) * format.channelsPerFrame;
    format.framesPerPacket = isCompanded ? 1u : isIMA4 ? 64u : 0u;
}

std::int32_t describeAIFF(const BodyReader& readBody, const ContainerLayout& layout, StreamDescription& format,
                          std::uint64_t& frames)
{
    const bool isAIFC = layout.fileType == fourCC("AIFC");
    const Bytes body = bodyOf(readBody, layout.find(fourCC("COMM")), isAIFC ? 22 : 18, 22);
    if (body.empty())
        return kStatusIOError;
    ByteReader reader(body);
    format.channelsPerFrame = reader.read<std::uint16_t>();
    frames = reader.read<std::uint32_t>();
    format.bitsPerChannel = reader.read<std::uint16_t>();
    format.sampleRate = loadExtended(reader.take(10).data());
    setAIFCFormat(format, isAIFC ? reader.readFourCC() : fourCC("NONE"));
    return kStatusOK;
}

std::int32_t describeCAF(const BodyReader& readBody, const ContainerLayout& layout, StreamDescription& format)
{
    const Bytes body = bodyOf(readBody, layout.find(fourCC("desc")), 32, 32);
    if (body.empty())
        return kStatusIOError;
    ByteReader reader(body);
    format.sampleRate = reader.read<double>();
    if (!std::isfinite(format.sampleRate) || format.sampleRate < 0)
        return kStatusIOError;
    format.formatId = reader.readFourCC();
    const auto flags = reader.read<std::uint32_t>();
    format.bytesPerPacket = reader.read<std::uint32_t>();
    format.framesPerPacket = reader.read<std::uint32_t>();
    format.channelsPerFrame = reader.read<std::uint32_t>();
    format.bitsPerChannel = reader.read<std::uint32_t>();
    if (format.formatId == StreamDescription::linearPCM) {
        format.bytesPerFrame = format.framesPerPacket > 0 ? format.bytesPerPacket / format.framesPerPacket : 0;
        setLinearPCM(format, flags & 1, !(flags & 2), true); // CAF: bit 0 float, bit 1 little-endian
    }
    return kStatusOK;
}

/// The packets that a CAF file of packets in differing sizes counts in its packet table.
std::uint64_t packetsOfTable(const BodyReader& readBody, const ContainerLayout& layout)
{
    const Bytes body = bodyOf(readBody, layout.find(fourCC("pakt")), 24, 24);
    return body.empty() ? 0 : static_cast<std::uint64_t>(std::max<std::int64_t>(0, loadBE<std::int64_t>(body.data())));
}

/// Finds the samples in "data" or "SSND".
std::int32_t locateData(const BodyReader& readBody, const ContainerLayout& layout, AudioDescription& description)
{
    const Chunk* data = layout.find(layout.audioDataId());
    if (data == nullptr)
        return kStatusIOError;
    std::uint64_t lead = 0; // ahead of the samples, in the body
    if (layout.kind == ContainerKind::caf)
        lead = 4; // edit count
    if (layout.kind == ContainerKind::iff) {
        const Bytes start = bodyOf(readBody, data, 8, 8);
        lead = start.empty() ? 8 : 8 + std::uint64_t{loadBE<std::uint32_t>(start.data())};
    }
    description.dataOffset = layout.bodyOf(*data) + std::min(lead, data->size);
    description.byteCount = data->size - std::min(lead, data->size);
    return kStatusOK;
}

} // namespace

std::int32_t describeAudio(const BodyReader& readBody, const ContainerLayout& layout, AudioDescription& description)
{
    description = {};
    StreamDescription& format = description.format;
    std::uint64_t frames = 0; // of AIFF; 0 also when nobody filled it in
    const std::int32_t status = layout.kind == ContainerKind::riff  ? describeWAVE(readBody, layout, format)
                                : layout.kind == ContainerKind::iff ? describeAIFF(readBody, layout, format, frames)
                                                                    : describeCAF(readBody, layout, format);
    if (status != kStatusOK)
        return status;
    if (format.channelsPerFrame == 0 || (format.isLinearPCM() && format.bytesPerPacket == 0))
        return kStatusIOError;
    if (const std::int32_t located = locateData(readBody, layout, description); located != kStatusOK)
        return located;
    if (format.bytesPerPacket > 0) {
        description.packetCount = description.byteCount / format.bytesPerPacket;
        if (frames > 0 && frames < description.packetCount) { // AIFF counts packets here
            description.packetCount = frames;
            description.byteCount = frames * format.bytesPerPacket;
        }
    } else {
        description.packetCount = layout.kind == ContainerKind::caf ? packetsOfTable(readBody, layout) : frames;
    }
    return kStatusOK;
}

double loadExtended(const std::byte* bytes)
{
    const auto head = loadBE<std::uint16_t>(bytes);
    const auto mantissa = loadBE<std::uint64_t>(bytes + 2);
    const int exponent = (head & 0x7FFF) - 16383;
    if (mantissa == 0 || exponent > 1023 || exponent < -1022 || (head & 0x8000))
        return 0;
    return std::ldexp(static_cast<double>(mantissa), exponent - 63);
}

void storeExtended(std::byte* bytes, double value)
{
    int exponent = 0;
    const double fraction = std::frexp(value, &exponent); // [0.5, 1)
    storeBE(bytes, static_cast<std::uint16_t>(value > 0 ? exponent - 1 + 16383 : 0));
    storeBE(bytes + 2, value > 0 ? static_cast<std::uint64_t>(std::ldexp(fraction, 64)) : std::uint64_t{0});
}

} // namespace platform
