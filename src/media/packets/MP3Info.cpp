#include "media/packets/MP3Info.h"

#include "platform/core/ByteReader.h"

#include <algorithm>
#include <array>

namespace platform {

namespace {

constexpr std::size_t kOffsetOfVBRI = MPEGFrameHeader::size + 32; // for any version and channels
constexpr std::size_t kSeekTableSize = 100;

/// From the header's id to the frame's end; empty if there is no such header.
BytesView infoHeader(const MPEGFrameHeader& header, BytesView frame)
{
    // Kept: in frames with a CRC, some writers skip its bytes and others do not.
    for (const std::size_t crcSize : {0U, 2U}) {
        const std::size_t offset = MPEGFrameHeader::size + crcSize + header.sideInfoSize();
        if (offset + 4 > frame.size() || (crcSize > 0 && !header.hasCRC))
            continue;
        const auto id = loadBE<FourCC>(frame.data() + offset);
        if (id == fourCC("Xing") || id == fourCC("Info"))
            return frame.subspan(offset);
    }
    return {};
}

bool writesPadding(std::string_view encoder)
{
    constexpr std::array<std::string_view, 4> names = {"LAME", "L3.9", "Lavf", "Lavc"};
    return std::ranges::any_of(names, [&](std::string_view name) { return encoder.substr(0, name.size()) == name; });
}

} // namespace

std::optional<MP3Info> MP3Info::parse(const MPEGFrameHeader& header, BytesView frame)
{
    MP3Info info;
    if (frame.size() >= kOffsetOfVBRI + 4 && loadBE<FourCC>(frame.data() + kOffsetOfVBRI) == fourCC("VBRI"))
        return info;
    const BytesView bytes = infoHeader(header, frame);
    if (bytes.empty())
        return {};
    ByteReader reader(bytes);
    reader.skip(4);
    enum : std::uint32_t { hasFrameCount = 1, hasByteCount = 2, hasSeekTable = 4, hasQuality = 8 };
    const auto flags = reader.read<std::uint32_t>();
    const std::uint32_t frameCount = flags & hasFrameCount ? reader.read<std::uint32_t>() : 0;
    const std::uint32_t byteCount = flags & hasByteCount ? reader.read<std::uint32_t>() : 0;
    if (!reader.ok())
        return info;
    if (flags & hasFrameCount)
        info.frameCount = frameCount;
    if (flags & hasByteCount)
        info.byteCount = byteCount;
    reader.skip((flags & hasSeekTable ? kSeekTableSize : 0) + (flags & hasQuality ? 4 : 0));
    const BytesView encoder = reader.take(9);
    reader.skip(12); // revision 1, low-pass 1, gains 8, flags 1, bit rate 1
    const std::uint32_t high = reader.read<std::uint8_t>();
    const std::uint32_t packed = high << 16 | reader.read<std::uint16_t>();
    if (reader.ok() && writesPadding(textOf(encoder)))
        info.padding = {.delay = packed >> 12, .padding = packed & 0xFFF};
    return info;
}

} // namespace platform
