// WAVE, RF64 and BW64. Published sources: Multimedia Programming Interface and Data Specifications 1.0, EBU Tech 3306,
// ITU-R BS.2088.
#include "audiofile/BusFormats.h"
#include "audiofile/ContainerDescriptions.h"

#include <optional>

namespace {

struct Chunks {
    std::optional<platform::StoredFormat> format;
    bool hasFormat = false; // a chunk of that id, if only the start of one
    bool hasData = false;
    std::optional<std::uint32_t> factFrames;
};

std::optional<platform::StoredFormat> readFormat(FileWindow& file, std::int64_t body, std::int64_t size)
{
    std::array<std::byte, platform::kMostOfStoredFormat> bytes{};
    const auto wanted = static_cast<std::size_t>(std::clamp<std::int64_t>(size, 0, std::int64_t{bytes.size()}));
    const std::size_t there = file.readSome(bytes.data(), body, wanted);
    return platform::storedFormatOfWAVE(BytesView(bytes).first(there));
}

platform::SoundChunk soundChunk(const ContainerChkExtended& header, const ChkHeader& data, std::int64_t body)
{
    const bool resolves = header.HasValidDs64();
    const bool isOpenContainer = header.size == 0xFFFFFFFF && !resolves;
    return {.body = static_cast<std::uint64_t>(body),
            .size = data.EffectiveSize(header),
            .isOpen = data.size == 0xFFFFFFFF && !resolves,
            .containerSize = isOpenContainer ? 0 : header.EffectiveSize()};
}

Chunks readChunks(FileWindow& file, const ContainerChkExtended& header, AudioFileInfo& info)
{
    Chunks chunks;
    VisitChunks(file, header, [&](const ChkHeader& chunk, std::int64_t body) {
        if (chunk.id == fourCC("fmt ") && !chunks.hasFormat) {
            chunks.hasFormat = true;
            chunks.format = readFormat(file, body, chunk.EffectiveSize(header));
        } else if (chunk.id == fourCC("fact") && !chunks.factFrames) {
            std::array<std::byte, 4> frames{};
            if (file.read(frames.data(), body, frames.size()) == kStatusOK)
                chunks.factFrames = loadLE<std::uint32_t>(frames.data());
        } else if (chunk.id == kData && !chunks.hasData) {
            const platform::SoundChunk sound = soundChunk(header, chunk, body);
            const bool isOpen = platform::isUnfinished(platform::ContainerKind::riff, sound);
            SetSampleData(info, body, static_cast<std::uint64_t>(isOpen ? INT64_MAX : sound.size));
            chunks.hasData = true;
        }
        // A "fact" behind the data is not looked for.
        return !(chunks.hasFormat && chunks.hasData);
    });
    return chunks;
}

// Whether the data are blocks of ADPCM as they should be, the last one too: of others it is the decoder that says how
// many frames they hold.
bool areWholeBlocks(const platform::StoredFormat& format, std::int64_t dataSize)
{
    constexpr FourCC microsoft = fourCC('m', 's', 0, 2);
    const platform::StreamDescription& stream = format.stream;
    const std::int64_t channels = stream.channelsPerFrame, bytes = stream.bytesPerPacket;
    // A block begins with a few bytes for each channel, which hold one frame, or two.
    const std::int64_t headerSize = (format.coding == microsoft ? 7 : 4) * channels;
    const std::int64_t inHeader = format.coding == microsoft ? 2 : 1;
    return channels > 0 && bytes > headerSize && dataSize % bytes == 0 && stream.bitsPerChannel == 4 &&
           stream.framesPerPacket == (bytes - headerSize) * 2 / channels + inHeader;
}

// Frames of compressed data. A "fact" is believed when its frames need the blocks that are there, where their size is
// known: some writers count the frames of IMA ADPCM once for all channels.
void setCompressedFrames(const ContainerChkExtended& header, const Chunks& chunks, AudioFileInfo& info)
{
    const platform::StreamDescription& stream = chunks.format->stream;
    const std::int64_t framesPerBlock = stream.framesPerPacket;
    const std::int64_t blocks = stream.bytesPerPacket > 0 ? info.dataSize / stream.bytesPerPacket : 0;
    const bool isLong = chunks.factFrames == 0xFFFFFFFFU && header.HasValidDs64();
    const std::int64_t said = isLong              ? static_cast<std::int64_t>(header.sampleCount)
                              : chunks.factFrames ? std::int64_t{*chunks.factFrames}
                                                  : 0;
    info.framesAreStated = blocks == 0 || framesPerBlock == 0 || stream.isLinearPCM() || info.missingDataSize > 0 ||
                           (framesPerBlock > 1 && !areWholeBlocks(*chunks.format, info.dataSize));
    const std::int64_t inBlocks = blocks * framesPerBlock;
    if (info.framesAreStated) { // no more than the blocks can hold, the one that is cut short too
        const std::int64_t most =
            framesPerBlock > 0 && stream.bytesPerPacket > 0 ? inBlocks + framesPerBlock : INT64_MAX;
        info.frames = chunks.factFrames ? std::clamp<std::int64_t>(said, 0, most) : inBlocks;
        return;
    }
    info.frames = said > inBlocks - framesPerBlock && said < inBlocks ? said : inBlocks;
}

} // namespace

std::int32_t DescribeWAVE(FileWindow& file, AudioFileInfo& info)
{
    info.formType = kWAVE;
    ContainerChkExtended header;
    const auto read = [&](void* to, std::int64_t at, std::size_t count) { return file.read(to, at, count); };
    if (ReadContainerHeaderFrom(read, header) != kStatusOK)
        return kStatusEndOfFile;
    info.containerId = header.id;
    const Chunks chunks = readChunks(file, header, info);
    if (!chunks.format)
        return kStatusEndOfFile;
    const platform::StoredFormat& format = *chunks.format;
    SetStoredFormat(info, format);
    info.speakers = format.speakers.value_or(0);
    if (format.speakers)
        info.busFormat = BusFormatOf(*format.speakers, info.channels);
    if (info.compressed)
        setCompressedFrames(header, chunks, info);
    else
        info.frames = info.bytesPerFrame > 0 ? info.dataSize / info.bytesPerFrame : 0;
    return chunks.hasData ? kStatusOK : kStatusEndOfFile;
}
