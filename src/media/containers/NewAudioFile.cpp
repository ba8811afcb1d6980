#include "media/containers/NewAudioFile.h"

#include "media/containers/ContainerLayout.h"
#include "media/containers/ExtendedFloat.h"
#include "platform/core/ByteWriter.h"

#include <cmath>

namespace platform {

namespace {

constexpr std::size_t kDataOffset = 4096; // samples begin on a page
using Flag = StreamDescription::Flag;

void writeHeader(ByteWriter& writer, FourCC id, std::uint32_t size)
{
    writer.writeFourCC(id);
    writer.write(size);
}

/// Filler, so that what follows it, `ahead` bytes long up to the samples, ends at the data offset.
void fillUp(ByteWriter& writer, std::size_t headerSize, std::size_t ahead)
{
    const std::size_t size = kDataOffset - ahead - headerSize - writer.size();
    writer.writeFourCC(ContainerLayout::filler);
    if (headerSize == 12)
        writer.write(std::uint64_t{size});
    else
        writer.write(static_cast<std::uint32_t>(size));
    writer.writeZeros(size);
}

Bytes newWAVE(const StreamDescription& format)
{
    ByteWriter writer(std::endian::little);
    writeHeader(writer, fourCC("RIFF"), kDataOffset - 8);
    writer.writeFourCC(fourCC("WAVE"));
    writeHeader(writer, fourCC("JUNK"), 28); // becomes the "ds64" when the file passes 4 GiB
    writer.writeZeros(28);
    const auto rate = static_cast<std::uint32_t>(std::lround(format.sampleRate));
    const bool isFloat = format.formatFlags & Flag::isFloat;
    writeHeader(writer, fourCC("fmt "), isFloat ? 18 : 16);
    writer.write(static_cast<std::uint16_t>(isFloat ? 3 : 1));
    writer.write(static_cast<std::uint16_t>(format.channelsPerFrame));
    writer.write(rate);
    writer.write(rate * format.bytesPerFrame);
    writer.write(static_cast<std::uint16_t>(format.bytesPerFrame));
    writer.write(static_cast<std::uint16_t>(format.bitsPerChannel));
    if (isFloat)
        writer.write(std::uint16_t{0}); // no extension, which all but integer samples must say
    fillUp(writer, 8, 8);
    writeHeader(writer, fourCC("data"), 0);
    return writer.take();
}

/// The compression type, and its name as a Pascal string padded to an even length.
void writeCompression(ByteWriter& writer, const StreamDescription& format)
{
    const bool isFloat = format.formatFlags & Flag::isFloat;
    const bool isBigEndian = format.formatFlags & Flag::isBigEndian;
    writer.writeFourCC(!isFloat                      ? isBigEndian ? fourCC("NONE") : fourCC("sowt")
                                            : format.bitsPerChannel == 32 ? fourCC("fl32")
                                                     : fourCC("fl64"));
    writer.write(std::uint16_t{0});
}

Bytes newAIFF(FourCC fileType, const StreamDescription& format)
{
    const bool isAIFC = fileType == fourCC("AIFC");
    ByteWriter writer;
    writeHeader(writer, fourCC("FORM"), kDataOffset - 8);
    writer.writeFourCC(fileType);
    if (isAIFC) {
        writeHeader(writer, fourCC("FVER"), 4);
        writer.write(std::uint32_t{0xA2805140}); // AIFC version 1
    }
    writeHeader(writer, fourCC("COMM"), isAIFC ? 24 : 18);
    writer.write(static_cast<std::uint16_t>(format.channelsPerFrame));
    writer.write(std::uint32_t{0}); // frames
    writer.write(static_cast<std::uint16_t>(format.bitsPerChannel));
    std::array<std::byte, 10> rate;
    storeExtended(rate.data(), format.sampleRate);
    writer.write(BytesView(rate));
    if (isAIFC)
        writeCompression(writer, format);
    fillUp(writer, 8, 16);
    writeHeader(writer, fourCC("SSND"), 8);
    writer.write(std::uint64_t{0}); // offset, block size
    return writer.take();
}

Bytes newCAF(const StreamDescription& format)
{
    ByteWriter writer;
    writer.writeFourCC(fourCC("caff"));
    writer.write(std::uint32_t{0x00010000}); // version 1, no flags
    writer.writeFourCC(fourCC("desc"));
    writer.write(std::uint64_t{32});
    writer.write(format.sampleRate);
    writer.writeFourCC(format.formatId);
    const bool isLittleEndian = !(format.formatFlags & Flag::isBigEndian);
    writer.write((format.formatFlags & Flag::isFloat ? 1u : 0u) | (isLittleEndian ? 2u : 0u));
    writer.write(format.bytesPerPacket);
    writer.write(format.framesPerPacket);
    writer.write(format.channelsPerFrame);
    writer.write(format.bitsPerChannel);
    fillUp(writer, 12, 16);
    writer.writeFourCC(fourCC("data"));
    writer.write(std::uint64_t{4});
    writer.write(std::uint32_t{0}); // edit count
    return writer.take();
}

} // namespace

Bytes newAudioFile(FourCC fileType, StreamDescription format)
{
    const SampleFormat sample = format.sampleFormat();
    const bool isBigEndian = sample.order == std::endian::big;
    const bool isWAVE = fileType == fourCC("WAVE");
    const bool isAIFF = fileType == fourCC("AIFF");
    if (!format.isLinearPCM() || !sample.isSupported() || format.channelsPerFrame == 0 ||
        format.channelsPerFrame > 0xFFFF || !(format.sampleRate > 0 && format.sampleRate <= 0xFFFFFFFF))
        return {};
    const std::uint64_t bytesPerFrame = std::uint64_t{format.channelsPerFrame} * (format.bitsPerChannel / 8);
    if (format.bytesPerFrame != bytesPerFrame || (isWAVE && bytesPerFrame > 0xFFFF))
        return {};
    // 8-bit samples have no byte order, and each container has one kind of them.
    if (format.bitsPerChannel == 8)
        format.formatFlags = isWAVE ? Flag::isPacked : Flag::isPacked | Flag::isSignedInteger | Flag::isBigEndian;
    else if (sample.isUnsigned || (isWAVE && isBigEndian) || (isAIFF && (!isBigEndian || sample.isFloat)))
        return {};
    format.formatFlags |= Flag::isPacked;
    format.bytesPerPacket = format.bytesPerFrame;
    format.framesPerPacket = 1;
    if (fileType == fourCC("AIFC") && sample.isFloat && !isBigEndian)
        return {};
    if (isWAVE)
        return newWAVE(format);
    if (isAIFF || fileType == fourCC("AIFC"))
        return newAIFF(fileType, format);
    return fileType == fourCC("caff") ? newCAF(format) : Bytes{};
}

} // namespace platform
