#include "media/ffmpeg/MusepackInfo.h"

#include "media/ffmpeg/Demuxer.h"
#include "platform/core/Bytes.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform::ffmpeg {

namespace {

/// Takes a number of 7 bits per byte, highest first, all bytes but the last marked; none beyond 63 bits or if the bytes
/// end.
std::optional<std::uint64_t> takeNumber(BytesView& bytes)
{
    constexpr std::size_t most = 9;
    std::uint64_t number = 0;
    for (std::size_t i = 0; i < std::min(bytes.size(), most); ++i) {
        const auto byte = std::to_integer<std::uint8_t>(bytes[i]);
        number = number << 7 | (byte & 0x7FU);
        if (byte < 0x80) {
            bytes = bytes.subspan(i + 1);
            return number;
        }
    }
    return {};
}

/// Parses the body of "SH": checksum, version, frames, silence ahead of them.
std::optional<MusepackInfo> infoOf(BytesView body)
{
    constexpr std::size_t fixedSize = 5, versionAt = 4;
    constexpr std::uint64_t delay = 481, mostFrames = std::uint64_t{1} << 48;
    if (body.size() < fixedSize || body[versionAt] != std::byte{8})
        return {};
    body = body.subspan(fixedSize);
    const auto frames = takeNumber(body), silence = takeNumber(body);
    if (!frames || !silence || *frames <= *silence || *frames > mostFrames || *silence > mostFrames)
        return {};
    return MusepackInfo{.lead = delay + *silence, .frames = *frames - *silence};
}

/// Where an ID3v2 tag (id3.org, 2.4.0) at the start ends; 0 if there is none.
std::uint64_t endOfTag(BytesView start)
{
    constexpr std::size_t headerSize = 10, flagsAt = 5, sizeAt = 6;
    if (start.size() < headerSize || textOf(start.first(3)) != "ID3")
        return 0;
    std::uint64_t size = 0;
    for (const std::byte part : start.subspan(sizeAt, 4))
        size = size << 7 | (std::to_integer<std::uint64_t>(part) & 0x7F);
    const bool hasFooter = (start[flagsAt] & std::byte{0x10}) != std::byte{0};
    return headerSize + size + (hasFooter ? headerSize : 0);
}

} // namespace

std::int32_t readMusepackInfo(Demuxer& demuxer, std::optional<MusepackInfo>& info)
{
    constexpr int mostPackets = 16; // before the header, which should be the first
    constexpr std::size_t keySize = 2;
    info.reset();
    if (demuxer.name() != "mpc8")
        return kStatusOK;
    std::array<std::byte, 32> bytes;
    std::int32_t status = kStatusOK; // after a failed read nothing is found
    const auto at = [&](std::uint64_t position) {
        std::size_t got = 0;
        if (status == kStatusOK)
            status = demuxer.readAt(position, bytes.data(), bytes.size(), got);
        return BytesView(bytes).first(got);
    };
    std::uint64_t position = endOfTag(at(0));
    if (const BytesView magic = at(position); magic.size() < 4 || textOf(magic.first(4)) != "MPCK")
        return status;
    position += 4;
    for (int i = 0; i < mostPackets; ++i) {
        const BytesView packet = at(position);
        if (packet.size() < keySize)
            break;
        BytesView body = packet.subspan(keySize);
        const auto size = takeNumber(body); // of the whole packet
        const std::size_t headerSize = packet.size() - body.size();
        if (!size || *size < headerSize || *size > demuxer.size())
            break;
        if (textOf(packet.first(keySize)) == "SH") {
            info = infoOf(body.first(std::min<std::size_t>(body.size(), static_cast<std::size_t>(*size) - headerSize)));
            break;
        }
        position += *size;
    }
    return status;
}

} // namespace platform::ffmpeg
