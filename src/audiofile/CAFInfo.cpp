// CAF. Published source: the published format description, version 1.0.
#include "audiofile/BusFormats.h"
#include "audiofile/ContainerDescriptions.h"
#include "audiofile/ContainerWalk.h"

#include "loops/tagging/ChunkIDs.h"
#include "platform/core/ByteReader.h"

#include <optional>

namespace {

constexpr FourCC kLinearPCM = fourCC("lpcm");
constexpr std::int64_t kEditCountSize = 4;

struct Description {
    double rate = 0;
    FourCC format = 0;
    std::uint32_t flags = 0; // of linear PCM: 1 floats, 2 little-endian
    std::uint32_t bytesPerPacket = 0;
    std::uint32_t framesPerPacket = 0;
    std::uint32_t channels = 0;
    std::uint32_t bits = 0;
};

struct PacketTable {
    std::int64_t packets = 0;
    std::int64_t frames = 0; // without those that prime the decoder and fill its last packet
};

struct Chunks {
    std::optional<Description> description;
    std::optional<PacketTable> packetTable;
    std::optional<tagging::LoopTiming> timing;
    std::uint32_t speakers = 0;
    bool hasData = false;
};

std::optional<Description> readDescription(FileWindow& file, std::int64_t body)
{
    std::array<std::byte, 32> bytes;
    if (file.read(bytes.data(), body, bytes.size()) != kStatusOK)
        return std::nullopt;
    ByteReader reader(bytes);
    Description description;
    description.rate = reader.read<double>();
    description.format = reader.readFourCC();
    description.flags = reader.read<std::uint32_t>();
    description.bytesPerPacket = reader.read<std::uint32_t>();
    description.framesPerPacket = reader.read<std::uint32_t>();
    description.channels = reader.read<std::uint32_t>();
    description.bits = reader.read<std::uint32_t>();
    return description;
}

std::optional<PacketTable> readPacketTable(FileWindow& file, std::int64_t body)
{
    std::array<std::byte, 24> bytes;
    if (file.read(bytes.data(), body, bytes.size()) != kStatusOK)
        return std::nullopt;
    ByteReader reader(bytes);
    PacketTable table;
    table.packets = reader.read<std::int64_t>();
    table.frames = reader.read<std::int64_t>();
    return table;
}

// The speakers of a channel layout, where it names them as a bitmap.
std::uint32_t readSpeakers(FileWindow& file, std::int64_t body)
{
    constexpr std::uint32_t byBitmap = 0x10000;
    std::array<std::byte, 8> bytes;
    const bool named =
        file.read(bytes.data(), body, bytes.size()) == kStatusOK && loadBE<std::uint32_t>(bytes.data()) == byBitmap;
    return named ? loadBE<std::uint32_t>(bytes.data() + 4) : 0;
}

std::optional<tagging::LoopTiming> readLoopTiming(FileWindow& file, std::int64_t body, std::int64_t size)
{
    constexpr std::int64_t most = 1 << 20; // bytes of text that are looked at
    tagging::UUIDBytes uuid;
    if (size < std::int64_t{sizeof uuid} || file.read(uuid, body, sizeof uuid) != kStatusOK ||
        cafChunkUUIDToChunkID(&uuid) != tagging::kBasicTagging)
        return std::nullopt;
    const std::int64_t start = body + std::int64_t{sizeof uuid};
    const std::int64_t there = std::min(size - std::int64_t{sizeof uuid}, file.length() - start);
    Bytes payload(static_cast<std::size_t>(std::clamp<std::int64_t>(there, 0, most)));
    payload.resize(file.readPieces(payload.data(), start, payload.size()));
    return tagging::LoopTimingInCAF(payload);
}

// Whether there is nothing more to look for: a packet table may stand behind the data that it tells of.
bool isComplete(const Chunks& chunks)
{
    return chunks.timing && chunks.description && chunks.hasData &&
           (chunks.description->format == kLinearPCM || chunks.packetTable);
}

void readChunk(FileWindow& file, FourCC id, std::int64_t body, std::int64_t size, Chunks& chunks, AudioFileInfo& info)
{
    if (id == fourCC("desc") && !chunks.description) {
        chunks.description = readDescription(file, body);
    } else if (id == fourCC("pakt") && !chunks.packetTable) {
        chunks.packetTable = readPacketTable(file, body);
    } else if (id == fourCC("chan")) {
        chunks.speakers = readSpeakers(file, body);
    } else if (id == kUuid && !chunks.timing) {
        chunks.timing = readLoopTiming(file, body, size);
    } else if (id == kData && !chunks.hasData) {
        // -1, and in a file that was never finished 0: to the end of the file.
        const std::int64_t samples = size > 0 ? std::max<std::int64_t>(size - kEditCountSize, 0) : INT64_MAX;
        SetSampleData(info, body + kEditCountSize, static_cast<std::uint64_t>(samples));
        chunks.hasData = true;
    }
}

Chunks readChunks(FileWindow& file, AudioFileInfo& info)
{
    Chunks chunks;
    WalkCAFChunks(file, [&](FourCC id, std::int64_t position, std::int64_t size) {
        readChunk(file, id, position + std::int64_t{sizeof(CAFChunkHeader)}, size, chunks, info);
        return !isComplete(chunks);
    });
    return chunks;
}

void setLinear(const Description& description, AudioFileInfo& info)
{
    const bool isFloat = (description.flags & 1) != 0;
    const std::endian order = (description.flags & 2) != 0 ? std::endian::little : std::endian::big;
    const std::uint32_t fromBits = description.bits / 8 + (description.bits % 8 != 0 ? 1 : 0);
    const bool divides = description.channels > 0 && description.bytesPerPacket % description.channels == 0;
    const std::uint32_t fromPacket = divides ? description.bytesPerPacket / description.channels : 0;
    const std::uint32_t bytes = fromPacket >= fromBits && fromPacket > 0 ? fromPacket : fromBits;
    SetLinearPCM(info, static_cast<int>(std::min<std::uint32_t>(bytes, 9)), isFloat, order);
    info.frames = info.bytesPerFrame > 0 ? info.dataSize / info.bytesPerFrame : 0;
}

// Frames of compressed data: no more than the packets hold that can be there, each of a byte at least.
std::int64_t compressedFrames(const Description& description, const std::optional<PacketTable>& table,
                              const AudioFileInfo& info)
{
    const std::int64_t packetsThere = info.dataSize / std::max<std::int64_t>(description.bytesPerPacket, 1);
    const std::int64_t framesPerPacket = description.framesPerPacket;
    std::int64_t capacity = 0;
    const std::int64_t packets = table ? std::clamp<std::int64_t>(table->packets, 0, packetsThere) : packetsThere;
    if (framesPerPacket == 0 || __builtin_mul_overflow(packets, framesPerPacket, &capacity))
        capacity = INT64_MAX;
    if (table)
        return std::clamp<std::int64_t>(table->frames, 0, capacity);
    return description.bytesPerPacket > 0 && framesPerPacket > 0 ? capacity : 0;
}

} // namespace

std::int32_t DescribeCAF(FileWindow& file, AudioFileInfo& info)
{
    constexpr std::uint32_t mostChannels = 65536; // more than that is no sound but a damaged header
    info.containerId = kCaff;
    const Chunks chunks = readChunks(file, info);
    if (!chunks.description)
        return kStatusEndOfFile;
    const Description& description = *chunks.description;
    info.channels = description.channels <= mostChannels ? static_cast<int>(description.channels) : 0;
    info.busFormat = BusFormatOf(chunks.speakers, info.channels);
    SetSampleRate(info, description.rate);
    if (description.format == kLinearPCM) {
        setLinear(description, info);
    } else {
        info.compressed = true;
        info.bitsPerSample = 0;
        info.formatCode = description.format;
        info.frames = compressedFrames(description, chunks.packetTable, info);
    }
    SetLoopTiming(info, chunks.timing);
    return chunks.hasData ? kStatusOK : kStatusEndOfFile;
}
