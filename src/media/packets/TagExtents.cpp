#include "media/packets/TagExtents.h"

#include "platform/core/Packed.h"

#include <algorithm>

namespace platform {

namespace {

constexpr std::size_t kID3v2HeaderSize = 10;
constexpr std::size_t kID3v1Size = 128;
constexpr std::size_t kAPEFooterSize = 32; // also of the optional header

bool is(BytesView bytes, std::string_view text)
{
    return bytes.size() >= text.size() && textOf(bytes.first(text.size())) == text;
}

/// Size of the tag that ends at `end`; 0 if there is none.
std::uint64_t trailingTagSize(PacketFile& file, std::uint64_t start, std::uint64_t end)
{
    if (end - start >= kID3v1Size && is(file.at(end - kID3v1Size, kID3v1Size), "TAG"))
        return kID3v1Size;
    if (end - start < kAPEFooterSize)
        return 0;
    const BytesView footer = file.at(end - kAPEFooterSize, kAPEFooterSize);
    if (footer.size() < kAPEFooterSize || !is(footer, "APETAGEX"))
        return 0;
    const std::uint64_t size = loadLE<std::uint32_t>(footer.data() + 12); // includes the footer but not the header
    const bool hasHeader = loadLE<std::uint32_t>(footer.data() + 20) >> 31;
    const std::uint64_t whole = size + (hasHeader ? kAPEFooterSize : 0);
    return size >= kAPEFooterSize && whole <= end - start ? whole : 0;
}

} // namespace

std::uint64_t leadingTagSize(PacketFile& file, std::uint64_t position)
{
    const BytesView header = file.at(position, kID3v2HeaderSize);
    if (header.size() < kID3v2HeaderSize || !is(header, "ID3") || header[3] == std::byte{0xFF})
        return 0;
    std::uint64_t size = 0;
    for (const std::byte part : header.subspan(6)) {
        if ((part & std::byte{0x80}) != std::byte{0})
            return 0;
        size = size << 7 | std::to_integer<std::uint64_t>(part);
    }
    const bool hasFooter = (header[5] & std::byte{0x10}) != std::byte{0};
    return size + kID3v2HeaderSize * (hasFooter ? 2 : 1);
}

std::uint64_t endOfLeadingTags(PacketFile& file)
{
    std::uint64_t end = 0;
    while (const std::uint64_t size = leadingTagSize(file, end))
        end += size;
    return std::min(end, file.length());
}

std::uint64_t startOfTrailingTags(PacketFile& file, std::uint64_t start)
{
    std::uint64_t end = std::max(start, file.length());
    while (const std::uint64_t size = trailingTagSize(file, start, end))
        end -= size;
    return end;
}

} // namespace platform
