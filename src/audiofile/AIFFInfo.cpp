// AIFF and AIFC. Published sources: Audio Interchange File Format 1.3, AIFF-C draft of 1991-08-26; the compression
// types are those in use.
#include "audiofile/ContainerDescriptions.h"

#include "loops/tagging/ChunkIDs.h"
#include "loops/tagging/Chunks.h"
#include "platform/core/ByteReader.h"

#include <cmath>
#include <optional>

namespace {

using std::endian;

// The compression types that are linear PCM. 0 bytes: as many as the chunk's bits need.
struct LinearType {
    FourCC type;
    int bytesPerSample;
    bool isFloat;
    endian order;
    bool isUnsigned = false;
};
constexpr std::array<LinearType, 15> kLinearTypes{{
    {fourCC("NONE"), 0, false, endian::big},
    {fourCC("twos"), 0, false, endian::big},
    {fourCC("sowt"), 0, false, endian::little},
    {fourCC("raw "), 1, false, endian::big, true},
    {fourCC("in24"), 3, false, endian::big},
    {fourCC("in32"), 4, false, endian::big},
    {fourCC("42ni"), 3, false, endian::little},
    {fourCC("42n1"), 3, false, endian::little},
    {fourCC("ni24"), 3, false, endian::little},
    {fourCC("23ni"), 4, false, endian::little},
    {fourCC("ni32"), 4, false, endian::little},
    {fourCC("fl32"), 4, true, endian::big},
    {fourCC("FL32"), 4, true, endian::big},
    {fourCC("fl64"), 8, true, endian::big},
    {fourCC("FL64"), 8, true, endian::big},
}};

// Compressed types whose "COMM" counts packets.
struct PacketType {
    FourCC type;
    int framesPerPacket;
};
constexpr std::array<PacketType, 3> kPacketTypes{{{fourCC("ima4"), 64}, {fourCC("MAC3"), 6}, {fourCC("MAC6"), 6}}};

struct Common {
    std::int16_t channels = 0;
    std::uint32_t frames = 0;
    std::int16_t bits = 0;
    double rate = 0;
    FourCC type = fourCC("NONE");
};

// An 80-bit extended float: sign, 15 bits of exponent, 64 bits of significand. What is no number gives one that is no
// rate.
double extendedFloat(ByteReader& reader)
{
    constexpr int bias = 16383;
    constexpr int notANumber = 0x7FFF;
    const auto signAndExponent = reader.read<std::uint16_t>();
    const auto significand = reader.read<std::uint64_t>();
    const int exponent = signAndExponent & 0x7FFF;
    if ((signAndExponent & 0x8000) != 0 || exponent == notANumber)
        return 0;
    return std::ldexp(static_cast<double>(significand), exponent - bias - 63);
}

std::optional<Common> readCommon(FileWindow& file, std::int64_t body, std::int64_t size)
{
    constexpr std::size_t plainSize = 18;
    std::array<std::byte, plainSize + 4> bytes{};
    const auto wanted = static_cast<std::size_t>(std::clamp<std::int64_t>(size, 0, std::int64_t{bytes.size()}));
    const std::size_t there = file.readSome(bytes.data(), body, wanted);
    if (there < plainSize)
        return std::nullopt;
    ByteReader reader(bytes);
    Common common;
    common.channels = reader.read<std::int16_t>();
    common.frames = reader.read<std::uint32_t>();
    common.bits = reader.read<std::int16_t>();
    common.rate = extendedFloat(reader);
    if (there == bytes.size())
        common.type = reader.readFourCC();
    return common;
}

// The samples stand behind 8 bytes, and as many more as the first four of these say. An offset beyond the chunk is
// ignored; a size that is all ones, or none in a container that ends ahead of the samples, is that of an unfinished
// recording. Kept: sizes of 2 GiB and more are taken as they are, although they end a walk.
void setSoundData(FileWindow& file, const ContainerChkExtended& header, const ChkHeader& chunk, std::int64_t body,
                  AudioFileInfo& info)
{
    constexpr std::uint32_t fixedSize = 8;
    const std::uint32_t stored = chunk.size;
    const bool unfinished = stored == 0xFFFFFFFF || (stored <= fixedSize && header.EffectiveSize() <= body);
    const std::uint32_t size = unfinished ? 0xFFFFFFFF : stored;
    std::array<std::byte, 4> bytes{};
    std::uint32_t offset = 0;
    if (size >= fixedSize && file.read(bytes.data(), body, bytes.size()) == kStatusOK)
        offset = loadBE<std::uint32_t>(bytes.data());
    if (offset > size - std::min(size, fixedSize) || body + fixedSize + offset > file.length())
        offset = 0;
    const std::uint32_t skipped = std::min(size, fixedSize) + offset;
    SetSampleData(info, body + skipped, unfinished ? UINT64_MAX : size - skipped);
}

std::optional<tagging::LoopTiming> readLoopTiming(FileWindow& file, std::int64_t body, std::int64_t size)
{
    std::array<std::byte, sizeof(tagging::BasicTaggingChunk)> bytes;
    const bool there = size >= std::int64_t{bytes.size()} && file.read(bytes.data(), body, bytes.size()) == kStatusOK;
    return there ? tagging::LoopTimingInAIFF(bytes) : std::nullopt;
}

void setFormat(const Common& common, bool isAIFC, AudioFileInfo& info)
{
    info.channels = std::max<std::int16_t>(common.channels, 0);
    info.busFormat = AudioBusFormatForChannels(info.channels);
    SetSampleRate(info, common.rate);
    const FourCC type = isAIFC ? common.type : fourCC("NONE");
    const auto linear = std::find_if(kLinearTypes.begin(), kLinearTypes.end(),
                                     [&](const LinearType& entry) { return entry.type == type; });
    if (linear != kLinearTypes.end()) {
        const int fromBits = (std::max<int>(common.bits, 0) + 7) / 8;
        SetLinearPCM(info, linear->bytesPerSample > 0 ? linear->bytesPerSample : fromBits, linear->isFloat,
                     linear->order, linear->isUnsigned);
        const std::int64_t there = info.bytesPerFrame > 0 ? info.dataSize / info.bytesPerFrame : 0;
        // A count of 0 with samples behind it was never filled in.
        info.frames = common.frames == 0 ? there : std::min<std::int64_t>(common.frames, there);
        return;
    }
    info.compressed = true;
    info.bitsPerSample = 0;
    info.formatCode = type;
    const auto packets = std::find_if(kPacketTypes.begin(), kPacketTypes.end(),
                                      [&](const PacketType& entry) { return entry.type == type; });
    info.frames = std::int64_t{common.frames} * (packets == kPacketTypes.end() ? 1 : packets->framesPerPacket);
}

} // namespace

std::int32_t DescribeAIFF(FileWindow& file, AudioFileInfo& info)
{
    info.formType = kAIFF;
    ContainerChkExtended header;
    const auto read = [&](void* to, std::int64_t at, std::size_t count) { return file.read(to, at, count); };
    if (ReadContainerHeaderFrom(read, header) != kStatusOK)
        return kStatusEndOfFile;
    info.containerId = header.id;
    info.formType = header.formType;
    std::optional<Common> common;
    std::optional<tagging::LoopTiming> timing;
    bool hasData = false;
    VisitChunks(file, header, [&](const ChkHeader& chunk, std::int64_t body) {
        if (chunk.id == fourCC("COMM") && !common) {
            common = readCommon(file, body, chunk.EffectiveSize(header));
        } else if (chunk.id == fourCC("SSND") && !hasData) {
            setSoundData(file, header, chunk, body, info);
            hasData = true;
        } else if (chunk.id == tagging::kBasicTagging && !timing) {
            timing = readLoopTiming(file, body, chunk.EffectiveSize(header));
        }
        return !(common && hasData && timing);
    });
    if (!common)
        return kStatusEndOfFile;
    setFormat(*common, header.formType == kAIFC, info);
    SetLoopTiming(info, timing);
    // Without frames there need be no sound data.
    return hasData || common->frames == 0 ? kStatusOK : kStatusEndOfFile;
}
