// WAVE, RF64 and BW64. Published sources: Multimedia Programming Interface and Data Specifications 1.0, EBU Tech 3306,
// ITU-R BS.2088; the registered format tags are those of RFC 2361.
#include "audiofile/BusFormats.h"
#include "audiofile/ContainerDescriptions.h"

#include "platform/core/ByteReader.h"

#include <optional>

namespace {

enum : std::uint16_t {
    kTagPCM = 0x0001,
    kTagADPCM = 0x0002,
    kTagFloat = 0x0003,
    kTagALaw = 0x0006,
    kTagMuLaw = 0x0007,
    kTagIMAADPCM = 0x0011,
    kTagExtensible = 0xFFFE,
};

// The bytes behind the tag in the sub-format GUIDs that stand for a tag: the general one, and the one of Ambisonic
// files.
constexpr std::array<std::uint8_t, 14> kTagGUID{0x00, 0x00, 0x00, 0x00, 0x10, 0x00, 0x80,
                                                0x00, 0x00, 0xAA, 0x00, 0x38, 0x9B, 0x71};
constexpr std::array<std::uint8_t, 14> kAmbisonicGUID{0x00, 0x00, 0x21, 0x07, 0xD3, 0x11, 0x86,
                                                      0x44, 0xC8, 0xC1, 0xCA, 0x00, 0x00, 0x00};

// The "fmt " chunk, as far as it is there; extensible ones come with the tag that their GUID stands for.
struct Format {
    std::uint16_t tag = 0;
    std::uint16_t channels = 0;
    std::uint32_t rate = 0;
    std::uint16_t blockAlign = 0; // bytes of a frame, or of a packet
    std::uint16_t bits = 0;
    std::uint16_t framesPerBlock = 0;      // of ADPCM
    std::optional<std::uint32_t> speakers; // of extensible ones
};

struct Chunks {
    std::optional<Format> format;
    bool hasData = false;
    std::optional<std::uint32_t> factFrames;
};

std::optional<Format> readFormat(FileWindow& file, std::int64_t body, std::int64_t size)
{
    constexpr std::int64_t plainSize = 16;
    std::array<std::byte, 40> bytes{};
    const auto wanted = static_cast<std::size_t>(std::clamp<std::int64_t>(size, 0, std::int64_t{bytes.size()}));
    const std::size_t there = file.readSome(bytes.data(), body, wanted);
    if (there < plainSize - 2) // the oldest writers leave out the bits
        return std::nullopt;
    ByteReader reader(bytes, std::endian::little);
    Format format;
    format.tag = reader.read<std::uint16_t>();
    format.channels = reader.read<std::uint16_t>();
    format.rate = reader.read<std::uint32_t>();
    reader.skip(4);
    format.blockAlign = reader.read<std::uint16_t>();
    format.bits = reader.read<std::uint16_t>();
    reader.skip(2);
    format.framesPerBlock = reader.read<std::uint16_t>(); // of extensible formats the valid bits
    if (format.tag == kTagExtensible && there == bytes.size()) {
        format.speakers = reader.read<std::uint32_t>();
        const auto tag = reader.read<std::uint16_t>();
        const BytesView guid = reader.take(kTagGUID.size());
        if (std::memcmp(guid.data(), kTagGUID.data(), guid.size()) == 0 ||
            std::memcmp(guid.data(), kAmbisonicGUID.data(), guid.size()) == 0)
            format.tag = tag;
    }
    return format;
}

// Bytes of one sample: what the frame size says, which counts for 20 bits in 3 bytes or 24 in 4, unless it cannot be.
int sampleContainer(const Format& format)
{
    const int fromBits = (format.bits + 7) / 8;
    const bool divides = format.channels > 0 && format.blockAlign % format.channels == 0;
    const int fromFrame = divides ? format.blockAlign / format.channels : 0;
    return fromFrame >= fromBits && fromFrame <= 8 ? fromFrame : fromBits;
}

// A recording that was never finished says nothing of its length: its size is all ones without a "ds64" that resolves
// it, or zero in a container that is as open, or that ends ahead of the samples.
bool isUnfinished(const ContainerChkExtended& header, const ChkHeader& data, std::int64_t body)
{
    const bool resolves = header.HasValidDs64();
    if (data.size == 0xFFFFFFFF && !resolves)
        return true;
    const bool openContainer = (header.size == 0xFFFFFFFF && !resolves) || header.EffectiveSize() <= body - 8;
    return data.EffectiveSize(header) == 0 && openContainer;
}

Chunks readChunks(FileWindow& file, const ContainerChkExtended& header, AudioFileInfo& info)
{
    Chunks chunks;
    VisitChunks(file, header, [&](const ChkHeader& chunk, std::int64_t body) {
        if (chunk.id == fourCC("fmt ") && !chunks.format) {
            chunks.format = readFormat(file, body, chunk.EffectiveSize(header));
        } else if (chunk.id == fourCC("fact") && !chunks.factFrames) {
            std::array<std::byte, 4> frames{};
            if (file.read(frames.data(), body, frames.size()) == kStatusOK)
                chunks.factFrames = loadLE<std::uint32_t>(frames.data());
        } else if (chunk.id == kData && !chunks.hasData) {
            const auto size = isUnfinished(header, chunk, body) ? INT64_MAX : chunk.EffectiveSize(header);
            SetSampleData(info, body, static_cast<std::uint64_t>(size));
            chunks.hasData = true;
        }
        // A "fact" behind the data is not looked for.
        return !(chunks.format && chunks.hasData);
    });
    return chunks;
}

// Frames of compressed data: what the file says, no more than its blocks can hold where their size is known.
std::int64_t compressedFrames(const ContainerChkExtended& header, const Chunks& chunks, const AudioFileInfo& info)
{
    const Format& format = *chunks.format;
    const bool blocks = format.tag == kTagADPCM || format.tag == kTagIMAADPCM;
    const std::int64_t framesPerBlock = blocks ? format.framesPerBlock : 1;
    const bool counted = (blocks || format.tag == kTagALaw || format.tag == kTagMuLaw) && format.blockAlign > 0;
    const std::int64_t capacity =
        counted ? (info.dataSize + format.blockAlign - 1) / format.blockAlign * framesPerBlock : INT64_MAX;
    if (!chunks.factFrames)
        return counted ? info.dataSize / format.blockAlign * framesPerBlock : 0;
    const bool isLong = *chunks.factFrames == 0xFFFFFFFF && header.HasValidDs64();
    const auto said = isLong ? static_cast<std::int64_t>(header.sampleCount) : std::int64_t{*chunks.factFrames};
    return std::clamp<std::int64_t>(said, 0, capacity);
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
    const Format& format = *chunks.format;
    info.channels = format.channels;
    info.busFormat =
        format.speakers ? BusFormatOf(*format.speakers, info.channels) : AudioBusFormatForChannels(info.channels);
    SetSampleRate(info, format.rate);
    if (format.tag == kTagPCM || format.tag == kTagFloat) {
        const int bytes = sampleContainer(format);
        SetLinearPCM(info, bytes, format.tag == kTagFloat, std::endian::little, bytes == 1);
        info.frames = info.bytesPerFrame > 0 ? info.dataSize / info.bytesPerFrame : 0;
    } else {
        info.compressed = true;
        info.bitsPerSample = 0;
        info.formatCode = fourCC('m', 's', static_cast<char>(format.tag >> 8), static_cast<char>(format.tag & 0xFF));
        info.frames = compressedFrames(header, chunks, info);
    }
    return chunks.hasData ? kStatusOK : kStatusEndOfFile;
}
