// CAF. Published source: its format description, version 1.0.
#include "audiofile/BusFormats.h"
#include "audiofile/ContainerDescriptions.h"
#include "audiofile/ContainerWalk.h"

#include "loops/tagging/ChunkIDs.h"
#include "media/containers/ChannelLayouts.h"
#include "media/decoding/CompressedAudio.h"
#include "platform/core/ByteReader.h"

#include <optional>

namespace {

constexpr std::int64_t kEditCountSize = 4;

struct PacketTable {
    std::int64_t packets = 0;
    std::int64_t frames = 0; // without those that prime the decoder and fill its last packet
};

struct Chunks {
    std::optional<platform::StoredFormat> format;
    bool hasDescription = false; // a chunk of that id, if only the start of one
    std::optional<PacketTable> packetTable;
    std::optional<tagging::LoopTiming> timing;
    std::uint32_t speakers = 0; // that the channels feed in their order
    std::uint32_t layout = 0;   // the same in any order
    bool hasData = false;
};

std::optional<platform::StoredFormat> readDescription(FileWindow& file, std::int64_t body, std::int64_t size)
{
    std::array<std::byte, platform::kMostOfStoredFormat> bytes;
    const auto wanted = static_cast<std::size_t>(std::clamp<std::int64_t>(size, 0, std::int64_t{bytes.size()}));
    return platform::storedFormatOfCAF(BytesView(bytes).first(file.readSome(bytes.data(), body, wanted)));
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

std::uint32_t readLayout(FileWindow& file, std::int64_t body)
{
    std::array<std::byte, 8> bytes;
    return file.read(bytes.data(), body, bytes.size()) == kStatusOK
               ? platform::speakersOfLayout(loadBE<std::uint32_t>(bytes.data()),
                                            loadBE<std::uint32_t>(bytes.data() + 4))
               : 0;
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
    return chunks.timing && chunks.hasDescription && chunks.hasData &&
           (!chunks.format || chunks.format->stream.isLinearPCM() || chunks.packetTable);
}

void readChunk(FileWindow& file, FourCC id, std::int64_t body, std::int64_t size, Chunks& chunks, AudioFileInfo& info)
{
    if (id == fourCC("desc") && !chunks.hasDescription) {
        chunks.hasDescription = true;
        chunks.format = readDescription(file, body, size);
    } else if (id == fourCC("pakt") && !chunks.packetTable) {
        chunks.packetTable = readPacketTable(file, body);
    } else if (id == fourCC("chan")) {
        chunks.speakers = readSpeakers(file, body);
        chunks.layout = readLayout(file, body);
    } else if (id == kUuid && !chunks.timing) {
        chunks.timing = readLoopTiming(file, body, size);
    } else if (id == kData && !chunks.hasData) {
        const bool isOpen = platform::isUnfinished(platform::ContainerKind::caf, {.size = size});
        const std::int64_t samples = isOpen ? INT64_MAX : std::max<std::int64_t>(size - kEditCountSize, 0);
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

// Frames of compressed data: no more than the packets hold that can be there, each of a byte at least.
std::int64_t compressedFrames(const platform::StreamDescription& description, const std::optional<PacketTable>& table,
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

// What the packets hold that are there, where the library finds them.
void setCompressedFrames(const platform::URLRef& url, const Chunks& chunks, AudioFileInfo& info)
{
    platform::CompressedAudio packets;
    info.framesAreStated = !url || platform::describePackets(*url, packets) != kStatusOK;
    if (info.framesAreStated) {
        info.frames = compressedFrames(chunks.format->stream, chunks.packetTable, info);
        return;
    }
    SetSampleRate(info, packets.format.sampleRate);
    info.channels = static_cast<std::int32_t>(packets.format.channelsPerFrame);
    info.sourceBits = static_cast<std::int32_t>(packets.format.bitsPerChannel);
    info.busFormat = BusFormatOf(chunks.speakers, info.channels);
    info.frames = static_cast<std::int64_t>(packets.frames);
    SetSoundFacts(info, packets.facts);
}

} // namespace

std::int32_t DescribeCAF(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info)
{
    info.containerId = kCaff;
    const Chunks chunks = readChunks(file, info);
    if (!chunks.format)
        return kStatusEndOfFile;
    SetStoredFormat(info, *chunks.format);
    info.busFormat = BusFormatOf(chunks.speakers, info.channels);
    info.speakers = chunks.layout;
    if (info.compressed)
        setCompressedFrames(url, chunks, info);
    else
        info.frames = info.bytesPerFrame > 0 ? info.dataSize / info.bytesPerFrame : 0;
    SetLoopTiming(info, chunks.timing);
    return chunks.hasData ? kStatusOK : kStatusEndOfFile;
}
