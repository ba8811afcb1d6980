#include "media/packets/OggPage.h"

#include "media/packets/HighFirstCRC.h"
#include "media/packets/PacketFile.h"

#include <numeric>

namespace platform {

namespace {

constexpr std::byte kMostInSegment{255};

/// Checksum of a page, in which its own field counts as zeros.
std::uint32_t checksumOf(BytesView page, std::size_t at)
{
    constexpr auto crc = highFirstCRC<32, 0x04C11DB7>;
    constexpr std::array<std::byte, 4> zeros{};
    return crc(page.subspan(at + zeros.size()), crc(zeros, crc(page.first(at), 0)));
}

} // namespace

std::optional<OggPage> OggPage::parse(BytesView bytes)
{
    // "OggS", version 1, flags 1, granule 8, serial number 4, page number 4, checksum 4, number of segments 1
    constexpr std::size_t kChecksumAt = 22;
    constexpr std::byte continued{1}, first{2}, last{4};
    if (bytes.size() < kHeaderSize || textOf(bytes.first(4)) != "OggS" || bytes[4] != std::byte{0})
        return {};
    const auto segments = std::to_integer<std::size_t>(bytes[kHeaderSize - 1]);
    if (bytes.size() < kHeaderSize + segments)
        return {};
    OggPage page;
    page.lacing = bytes.subspan(kHeaderSize, segments);
    const std::size_t body =
        std::accumulate(page.lacing.begin(), page.lacing.end(), std::size_t{0},
                        [](std::size_t sum, std::byte size) { return sum + std::to_integer<std::size_t>(size); });
    if (bytes.size() < kHeaderSize + segments + body)
        return {};
    page.body = bytes.subspan(kHeaderSize + segments, body);
    page.isContinued = (bytes[5] & continued) != std::byte{0};
    page.isFirst = (bytes[5] & first) != std::byte{0};
    page.isLast = (bytes[5] & last) != std::byte{0};
    page.granule = loadLE<std::int64_t>(bytes.data() + 6);
    page.serial = loadLE<std::uint32_t>(bytes.data() + 14);
    page.number = loadLE<std::uint32_t>(bytes.data() + 18);
    const bool isWhole =
        checksumOf(bytes.first(page.size()), kChecksumAt) == loadLE<std::uint32_t>(bytes.data() + kChecksumAt);
    return isWhole ? std::optional(page) : std::nullopt;
}

bool OggPage::endsPacket() const
{
    for (const std::byte size : lacing)
        if (size != kMostInSegment)
            return true;
    return false;
}

std::vector<OggPage> lastOggPages(BytesView bytes)
{
    constexpr std::string_view marker = "OggS";
    constexpr int mostTries = 3; // a marker without a page may occur by chance in gigabytes, or on purpose
    std::vector<OggPage> pages;
    for (int tries = 0; tries < mostTries && pages.empty(); ++tries) {
        const std::size_t at = textOf(bytes).find(marker);
        if (at == std::string_view::npos)
            return {};
        bytes = bytes.subspan(at);
        while (const std::optional<OggPage> page = OggPage::parse(bytes)) {
            pages.push_back(*page);
            bytes = bytes.subspan(page->size());
        }
        if (pages.empty())
            bytes = bytes.subspan(marker.size());
    }
    return bytes.empty() ? pages : std::vector<OggPage>();
}

bool OggPackets::add(const OggPage& page, const Visit& visit)
{
    if (isStart_ && page.isContinued) {
        isInside_ = true;
        isWhole_ = false;
    }
    isStart_ = false;
    if (page.isContinued != isInside_)
        return false;
    std::size_t start = 0, end = 0;
    for (const std::byte size : page.lacing) {
        end += std::to_integer<std::size_t>(size);
        isInside_ = size == kMostInSegment;
        if (isInside_)
            continue;
        const BytesView piece = page.body.subspan(start, end - start);
        start = end;
        const bool isPiece = !begun_.empty();
        if (isPiece)
            begun_.insert(begun_.end(), piece.begin(), piece.end());
        const bool isTaken = !isWhole_ || visit(isPiece ? BytesView(begun_) : piece);
        begun_.clear();
        isWhole_ = true;
        if (!isTaken)
            return false;
    }
    if (isWhole_)
        begun_.insert(begun_.end(), page.body.begin() + static_cast<std::ptrdiff_t>(start), page.body.end());
    return begun_.size() <= PacketFile::kLargestPacket;
}

} // namespace platform
