// Published sources: Multimedia Programming Interface and Data Specifications 1.0, EBU Tech 3306 (RF64), AIFF 1.3 and
// the AIFF-C draft of 1991-08-26, the published format description of CAF, version 1.0.
#include "audiofile/AudioFileHeader.h"

#include "audiofile/BusFormats.h"
#include "media/containers/ContainerHeaders.h"
#include "media/containers/ExtendedFloat.h"
#include "platform/core/ByteWriter.h"

#include <array>
#include <bit>
#include <cstring>

namespace {

struct Layout {
    std::int64_t frames = 0;
    std::int64_t sampleRate = 0;
    int channels = 0;
    int bits = 0;
    bool isFloat = false;
    std::uint32_t speakers = 0; // a bit for each, as WAVE and CAF number them; 0 when it is open which they are
    std::int64_t dataSize = 0;

    int bytesPerFrame() const { return channels * bits / 8; }
    std::int64_t paddedSize() const { return dataSize + (dataSize & 1); }
};

constexpr std::int64_t kMost32 = 0xFFFFFFFF;

void writeFormatChunk(ByteWriter& out, const Layout& layout)
{
    constexpr std::uint16_t tagPCM = 1;
    constexpr std::uint16_t tagFloat = 3;
    constexpr std::uint16_t tagExtensible = 0xFFFE;
    constexpr std::array<std::uint8_t, 14> tagGUID{0, 0, 0, 0, 0x10, 0, 0x80, 0, 0, 0xAA, 0, 0x38, 0x9B, 0x71};
    const std::uint16_t tag = layout.isFloat ? tagFloat : tagPCM;
    const bool extensible = layout.channels > 2 || (!layout.isFloat && layout.bits > 16);
    const auto bits = static_cast<std::uint16_t>(layout.bits);
    out.writeFourCC(fourCC("fmt "));
    out.write<std::uint32_t>(extensible ? 40 : layout.isFloat ? 18 : 16);
    out.write(extensible ? tagExtensible : tag);
    out.write(static_cast<std::uint16_t>(layout.channels));
    out.write(static_cast<std::uint32_t>(layout.sampleRate));
    out.write(static_cast<std::uint32_t>(std::min(layout.sampleRate * layout.bytesPerFrame(), kMost32)));
    out.write(static_cast<std::uint16_t>(layout.bytesPerFrame()));
    out.write(bits);
    if (extensible) {
        out.write<std::uint16_t>(22);
        out.write(bits); // all of them valid
        out.write(layout.speakers);
        out.write(tag);
        out.write(std::as_bytes(std::span(tagGUID)));
    } else if (layout.isFloat) {
        out.write<std::uint16_t>(0);
    }
    if (layout.isFloat) { // what is not PCM counts its frames
        out.writeFourCC(fourCC("fact"));
        out.write<std::uint32_t>(4);
        out.write(static_cast<std::uint32_t>(std::min(layout.frames, kMost32)));
    }
}

// The body of a "ds64", or of the "JUNK" that may become one: kept current in both.
void writeReservation(ByteWriter& out, FourCC id, std::int64_t riffSize, const Layout& layout)
{
    out.writeFourCC(id);
    out.write<std::uint32_t>(ContainerChkExtended::kDs64FixedSize);
    out.write(riffSize);
    out.write(layout.dataSize);
    out.write(layout.frames);
    out.write<std::uint32_t>(0); // no table
}

Bytes waveHeader(const Layout& layout, bool reserve)
{
    if (layout.bytesPerFrame() > 0xFFFF || layout.sampleRate > kMost32)
        return {};
    ByteWriter format(std::endian::little);
    writeFormatChunk(format, layout);
    const std::size_t reservation = reserve ? 8 + ContainerChkExtended::kDs64FixedSize : 0;
    const std::size_t length = sizeof(ContainerChk) + reservation + format.size() + sizeof(ChkHeader);
    const std::int64_t riffSize = static_cast<std::int64_t>(length) - 8 + layout.paddedSize();
    const bool isLong = riffSize > kMost32;
    if (isLong && !reserve)
        return {};
    ByteWriter out(std::endian::little);
    out.writeFourCC(isLong ? kRF64 : kRIFF);
    out.write(static_cast<std::uint32_t>(std::min(riffSize, kMost32)));
    out.writeFourCC(kWAVE);
    if (reserve)
        writeReservation(out, isLong ? kDs64 : kJUNK, riffSize, layout);
    out.write(format.view());
    out.writeFourCC(kData);
    out.write(static_cast<std::uint32_t>(isLong ? kMost32 : layout.dataSize));
    return out.take();
}

Bytes aiffHeader(const Layout& layout)
{
    constexpr std::uint32_t versionOfAIFC = 0xA2805140;
    constexpr std::uint32_t soundDataFixedSize = 8;
    constexpr std::int64_t most = 0x7FFFFFFF; // sizes are signed
    if (layout.channels > 0x7FFF)
        return {};
    ByteWriter out;
    out.writeFourCC(kFORM);
    const std::size_t formSizeAt = out.size();
    out.write<std::uint32_t>(0);
    out.writeFourCC(layout.isFloat ? kAIFC : kAIFF);
    if (layout.isFloat) {
        out.writeFourCC(fourCC("FVER"));
        out.write<std::uint32_t>(4);
        out.write(versionOfAIFC);
    }
    // A text behind its length, of which the sum is even.
    const std::string_view name = layout.bits == 64 ? "64-bit floating point" : "32-bit floating point";
    out.writeFourCC(fourCC("COMM"));
    out.write(static_cast<std::uint32_t>(layout.isFloat ? 18 + 4 + 1 + name.size() : 18));
    out.write(static_cast<std::int16_t>(layout.channels));
    out.write(static_cast<std::uint32_t>(std::min(layout.frames, kMost32)));
    out.write(static_cast<std::int16_t>(layout.bits));
    std::array<std::byte, platform::kExtendedSize> rate;
    platform::storeExtended(rate.data(), static_cast<double>(layout.sampleRate));
    out.write(rate);
    if (layout.isFloat) {
        out.writeFourCC(layout.bits == 64 ? fourCC("fl64") : fourCC("fl32"));
        out.write(static_cast<std::uint8_t>(name.size()));
        out.write(bytesOf(name));
    }
    out.writeFourCC(fourCC("SSND"));
    out.write(static_cast<std::uint32_t>(std::min(layout.dataSize, most) + soundDataFixedSize));
    out.writeZeros(soundDataFixedSize); // offset and block size
    const std::int64_t formSize = static_cast<std::int64_t>(out.size()) - 8 + layout.paddedSize();
    if (formSize > most)
        return {};
    out.patch(formSizeAt, static_cast<std::uint32_t>(formSize));
    return out.take();
}

Bytes cafHeader(const Layout& layout)
{
    constexpr std::uint32_t floats = 1;
    constexpr std::uint32_t littleEndian = 2;
    constexpr std::uint32_t layoutBySpeakers = 0x10000;
    constexpr std::int64_t editCountSize = 4;
    ByteWriter out;
    out.writeFourCC(kCaff);
    out.write<std::uint16_t>(1); // version
    out.write<std::uint16_t>(0);
    out.writeFourCC(fourCC("desc"));
    out.write<std::int64_t>(32);
    out.write(static_cast<double>(layout.sampleRate));
    out.writeFourCC(fourCC("lpcm"));
    out.write(littleEndian | (layout.isFloat ? floats : 0));
    out.write(static_cast<std::uint32_t>(layout.bytesPerFrame()));
    out.write<std::uint32_t>(1); // frame in a packet
    out.write(static_cast<std::uint32_t>(layout.channels));
    out.write(static_cast<std::uint32_t>(layout.bits));
    if (layout.channels > 2 && layout.speakers != 0) {
        out.writeFourCC(fourCC("chan"));
        out.write<std::int64_t>(12);
        out.write(layoutBySpeakers);
        out.write(layout.speakers);
        out.write<std::uint32_t>(0); // no further descriptions
    }
    out.writeFourCC(kData);
    out.write(layout.dataSize + editCountSize);
    out.write<std::uint32_t>(0); // edit count
    return out.take();
}

Bytes header(FourCC fileType, const Layout& layout, bool reserve)
{
    switch (fileType) {
    case kWAVE:
        return waveHeader(layout, reserve);
    case kAIFF:
        return aiffHeader(layout);
    case kCaff:
        return cafHeader(layout);
    default:
        return {};
    }
}

} // namespace

long BuildAudioFileHeader(void* buffer, FourCC fileType, long long frames, long long sampleRate, int channels, int bits,
                          TAudioBusFormat busFormat, bool option)
{
    constexpr int mostChannels = 0xFFFF;
    constexpr std::int64_t mostData = std::int64_t{1} << 62;
    const bool isFloat = bits == -32 || bits == 64;
    Layout layout{frames,
                  sampleRate,
                  channels == 0 ? AudioBusFormatChannels(busFormat) : channels,
                  isFloat && bits < 0 ? -bits : bits,
                  isFloat,
                  0,
                  0};
    const bool knownBits = isFloat || bits == 8 || bits == 16 || bits == 24 || bits == 32;
    if (!knownBits || frames < 0 || sampleRate < 1 || layout.channels < 1 || layout.channels > mostChannels ||
        frames > mostData / layout.bytesPerFrame())
        return 0;
    layout.speakers = SpeakersOf(busFormat, layout.channels);
    layout.dataSize = frames * layout.bytesPerFrame();
    const Bytes built = header(fileType, layout, option);
    if (!built.empty())
        std::memcpy(buffer, built.data(), built.size());
    return static_cast<long>(built.size());
}
