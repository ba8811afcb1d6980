// Published sources: RIFF as published in August 1991, EBU Tech 3306 (RF64), AIFF 1.3 and
// the AIFF-C draft of 1991-08-26, the published format description of CAF, version 1.0.
#include "media/containers/NewContainer.h"

#include "media/containers/ContainerHeaders.h"
#include "media/containers/ExtendedFloat.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <span>
#include <string_view>

namespace platform {

namespace {

using Flag = StreamDescription::Flag;

constexpr std::uint64_t kMost32 = 0xFFFFFFFF;
constexpr std::uint64_t kMostSigned32 = 0x7FFFFFFF;

std::uint64_t dataSizeOf(const NewContainer& file)
{
    return file.frames * file.format.bytesPerFrame;
}

std::uint64_t paddedSizeOf(const NewContainer& file)
{
    return dataSizeOf(file) + (dataSizeOf(file) & 1);
}

bool isFloat(const NewContainer& file)
{
    return (file.format.formatFlags & Flag::isFloat) != 0;
}

std::uint32_t atMost32Bits(std::uint64_t number)
{
    return static_cast<std::uint32_t>(std::min(number, kMost32));
}

/// Adds filler so that the samples, `ahead` bytes behind it, begin at the wanted offset.
void fillUp(ByteWriter& out, const NewContainer& file, std::size_t ahead)
{
    const bool isCAF = file.fileType == kCaff;
    const std::size_t taken = out.size() + (isCAF ? sizeof(CAFChunkHeader) : sizeof(ChkHeader)) + ahead;
    if (file.dataOffset < taken)
        return;
    const std::size_t size = file.dataOffset - taken;
    out.writeFourCC(kFree);
    if (isCAF)
        out.write(std::uint64_t{size});
    else
        out.write(static_cast<std::uint32_t>(size));
    out.writeZeros(size);
}

void writeFormatChunk(ByteWriter& out, const NewContainer& file)
{
    constexpr std::uint16_t tagPCM = 1;
    constexpr std::uint16_t tagFloat = 3;
    constexpr std::uint16_t tagExtensible = 0xFFFE;
    constexpr std::array<std::uint8_t, 14> tagGUID{0, 0, 0, 0, 0x10, 0, 0x80, 0, 0, 0xAA, 0, 0x38, 0x9B, 0x71};
    const StreamDescription& format = file.format;
    const std::uint16_t tag = isFloat(file) ? tagFloat : tagPCM;
    const bool extensible =
        file.speakers && (format.channelsPerFrame > 2 || (!isFloat(file) && format.bitsPerChannel > 16));
    const auto rate = static_cast<std::uint32_t>(std::llround(format.sampleRate));
    const auto bits = static_cast<std::uint16_t>(format.bitsPerChannel);
    out.writeFourCC(fourCC("fmt "));
    out.write<std::uint32_t>(extensible ? 40 : isFloat(file) ? 18 : 16);
    out.write(extensible ? tagExtensible : tag);
    out.write(static_cast<std::uint16_t>(format.channelsPerFrame));
    out.write(rate);
    out.write(atMost32Bits(std::uint64_t{rate} * format.bytesPerFrame));
    out.write(static_cast<std::uint16_t>(format.bytesPerFrame));
    out.write(bits);
    if (extensible) {
        out.write<std::uint16_t>(22);
        out.write(bits); // all bits are valid
        out.write(*file.speakers);
        out.write(tag);
        out.write(std::as_bytes(std::span(tagGUID)));
    } else if (isFloat(file)) {
        out.write<std::uint16_t>(0);
    }
    if (isFloat(file) && file.isCounted) { // only formats other than PCM count their frames
        out.writeFourCC(fourCC("fact"));
        out.write<std::uint32_t>(4);
        out.write(atMost32Bits(file.frames));
    }
}

/// The body of a "ds64" or of the "JUNK" that may become one; both are kept up to date.
void writeReservation(ByteWriter& out, FourCC id, std::uint64_t riffSize, const NewContainer& file)
{
    out.writeFourCC(id);
    out.write<std::uint32_t>(ContainerChkExtended::kDs64FixedSize);
    out.write(riffSize);
    out.write(dataSizeOf(file));
    out.write(file.frames);
    out.write<std::uint32_t>(0); // no table
}

Bytes headerOfWAVE(const NewContainer& file)
{
    if (file.format.bytesPerFrame > 0xFFFF)
        return {};
    const auto written = [&](std::uint64_t riffSize) {
        const bool isLong = riffSize > kMost32;
        ByteWriter out(std::endian::little);
        out.writeFourCC(isLong ? kRF64 : kRIFF);
        out.write(atMost32Bits(riffSize));
        out.writeFourCC(kWAVE);
        if (file.hasReservation)
            writeReservation(out, isLong ? kDs64 : kJUNK, riffSize, file);
        writeFormatChunk(out, file);
        out.write(file.chunks);
        fillUp(out, file, sizeof(ChkHeader));
        out.writeFourCC(kData);
        out.write(isLong ? static_cast<std::uint32_t>(kMost32) : static_cast<std::uint32_t>(dataSizeOf(file)));
        return out.take();
    };
    const std::uint64_t size = written(0).size() - 8 + paddedSizeOf(file);
    return size <= kMost32 || file.hasReservation ? written(size) : Bytes{};
}

/// Writes the compression type and its name as a counted text, padded to an even length.
void writeCompression(ByteWriter& out, const NewContainer& file)
{
    FourCC type = (file.format.formatFlags & Flag::isBigEndian) != 0 ? fourCC("NONE") : fourCC("sowt");
    std::string_view name;
    if (isFloat(file)) {
        const bool isDouble = file.format.bitsPerChannel == 64;
        type = isDouble ? fourCC("fl64") : fourCC("fl32");
        name = isDouble ? "64-bit floating point" : "32-bit floating point";
    }
    out.writeFourCC(type);
    out.write(static_cast<std::uint8_t>(name.size()));
    out.write(bytesOf(name));
    if (name.size() % 2 == 0)
        out.writeZeros(1);
}

Bytes headerOfAIFF(const NewContainer& file)
{
    constexpr std::uint32_t versionOfAIFC = 0xA2805140;
    constexpr std::uint32_t soundDataFixedSize = 8;
    if (file.format.channelsPerFrame > 0x7FFF)
        return {};
    const bool isAIFC = file.fileType == kAIFC;
    ByteWriter out;
    out.writeFourCC(kFORM);
    const std::size_t formSizeAt = out.size();
    out.write<std::uint32_t>(0);
    out.writeFourCC(file.fileType);
    if (isAIFC) {
        out.writeFourCC(fourCC("FVER"));
        out.write<std::uint32_t>(4);
        out.write(versionOfAIFC);
    }
    out.writeFourCC(fourCC("COMM"));
    const std::size_t commonSizeAt = out.size();
    out.write<std::uint32_t>(0);
    out.write(static_cast<std::int16_t>(file.format.channelsPerFrame));
    out.write(atMost32Bits(file.frames));
    out.write(static_cast<std::int16_t>(file.format.bitsPerChannel));
    std::array<std::byte, kExtendedSize> rate;
    storeExtended(rate.data(), file.format.sampleRate);
    out.write(rate);
    if (isAIFC)
        writeCompression(out, file);
    out.patch(commonSizeAt, static_cast<std::uint32_t>(out.size() - commonSizeAt - sizeof(std::uint32_t)));
    out.write(file.chunks);
    fillUp(out, file, sizeof(ChkHeader) + soundDataFixedSize);
    out.writeFourCC(fourCC("SSND"));
    out.write(static_cast<std::uint32_t>(std::min(dataSizeOf(file), kMostSigned32) + soundDataFixedSize));
    out.writeZeros(soundDataFixedSize); // offset and block size
    const std::uint64_t formSize = out.size() - 8 + paddedSizeOf(file);
    if (formSize > kMostSigned32)
        return {};
    out.patch(formSizeAt, static_cast<std::uint32_t>(formSize));
    return out.take();
}

Bytes headerOfCAF(const NewContainer& file)
{
    constexpr std::uint32_t floats = 1;
    constexpr std::uint32_t littleEndian = 2;
    constexpr std::uint32_t layoutBySpeakers = 0x10000;
    constexpr std::uint32_t editCountSize = 4;
    const StreamDescription& format = file.format;
    const bool isLittleEndian = (format.formatFlags & Flag::isBigEndian) == 0;
    ByteWriter out;
    out.writeFourCC(kCaff);
    out.write<std::uint16_t>(1); // version
    out.write<std::uint16_t>(0);
    out.writeFourCC(fourCC("desc"));
    out.write<std::int64_t>(32);
    out.write(format.sampleRate);
    out.writeFourCC(format.formatId);
    out.write((isLittleEndian ? littleEndian : 0) | (isFloat(file) ? floats : 0));
    out.write(format.bytesPerFrame);
    out.write<std::uint32_t>(1); // frame in a packet
    out.write(format.channelsPerFrame);
    out.write(format.bitsPerChannel);
    if (const std::uint32_t speakers = file.speakers.value_or(0); format.channelsPerFrame > 2 && speakers != 0) {
        out.writeFourCC(fourCC("chan"));
        out.write<std::int64_t>(12);
        out.write(layoutBySpeakers);
        out.write(speakers);
        out.write<std::uint32_t>(0); // no further descriptions
    }
    out.write(file.chunks);
    fillUp(out, file, sizeof(CAFChunkHeader) + editCountSize);
    out.writeFourCC(kData);
    out.write(dataSizeOf(file) + editCountSize);
    out.write<std::uint32_t>(0); // edit count
    return out.take();
}

/// Whether the container can hold the samples; also sets the properties that it dictates.
bool fits(NewContainer& file)
{
    constexpr std::uint64_t mostData = std::uint64_t{1} << 62;
    StreamDescription& format = file.format;
    const SampleFormat sample = format.sampleFormat();
    const bool isBigEndian = sample.order == std::endian::big;
    const bool isWAVE = file.fileType == kWAVE, isAIFF = file.fileType == kAIFF, isAIFC = file.fileType == kAIFC;
    if (!format.isLinearPCM() || !sample.isSupported() || format.channelsPerFrame == 0 ||
        format.channelsPerFrame > 0xFFFF || !(format.sampleRate > 0))
        return false;
    const std::uint64_t bytesPerFrame = std::uint64_t{format.channelsPerFrame} * (format.bitsPerChannel / 8);
    if (format.bytesPerFrame != bytesPerFrame || file.frames > mostData / bytesPerFrame ||
        (isWAVE && format.sampleRate > static_cast<double>(kMost32)))
        return false;
    // 8-bit samples have no byte order, and each container supports only one kind of them.
    if (format.bitsPerChannel == 8)
        format.formatFlags = isWAVE             ? 0U
                             : isAIFF || isAIFC ? Flag::isSignedInteger | Flag::isBigEndian
                                                : Flag::isSignedInteger | (format.formatFlags & Flag::isBigEndian);
    else if (sample.isUnsigned || (isWAVE && isBigEndian) || (isAIFF && (!isBigEndian || sample.isFloat)) ||
             (isAIFC && sample.isFloat && !isBigEndian))
        return false;
    return true;
}

} // namespace

Bytes headerOf(NewContainer file)
{
    if (!fits(file))
        return {};
    switch (file.fileType) {
    case kWAVE:
        return headerOfWAVE(file);
    case kAIFF:
    case kAIFC:
        return headerOfAIFF(file);
    case kCaff:
        return headerOfCAF(file);
    default:
        return {};
    }
}

} // namespace platform
