#include "media/packets/ADTSPackets.h"

#include "media/packets/Codings.h"
#include "media/packets/TagExtents.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform {

namespace {

constexpr std::uint32_t kADTSHeaderSize = 7;
constexpr std::uint32_t kADTSCRCSize = 2;
static_assert(kADTSHeaderSize == FrameIndex::kHeaderSize);

// The first four bytes. Bits: sync 12, version 1, layer 2, no CRC 1, profile 2, rate 4, private 1, channels 3,
// original 1, home 1, copyright 2, and the high 2 of the length.
constexpr std::uint32_t kSyncMask = 0xFFF60000;
constexpr std::uint32_t kSync = 0xFFF00000;
constexpr std::uint32_t kADTSKindMask = 0xFFF6FDC0; // sync, layer, profile, rate, channels
constexpr std::uint32_t kNoCRC = 0x00010000;

/// Length of the frame, header included; 0 if there is none.
std::uint32_t frameSize(const std::byte* header)
{
    const auto bits = loadBE<std::uint32_t>(header);
    const std::uint32_t size = (bits & 3) << 11 | loadBE<std::uint16_t>(header + 4) >> 5;
    const bool isFrame = (bits & kSyncMask) == kSync && size > kADTSHeaderSize + (bits & kNoCRC ? 0 : kADTSCRCSize);
    return isFrame ? size : 0;
}

std::uint32_t blocksBehindFirst(const std::byte* header)
{
    return std::to_integer<std::uint32_t>(header[6]) & 3;
}

} // namespace

std::unique_ptr<PacketSource> ADTSPackets::open(std::unique_ptr<PacketFile>& file, std::int32_t& status)
{
    const std::uint64_t start = endOfLeadingTags(*file);
    const BytesView bytes = file->at(start, FrameIndex::kLargestFrame + kADTSHeaderSize);
    const std::uint32_t size = bytes.size() >= kADTSHeaderSize ? frameSize(bytes.data()) : 0;
    // Another frame of this kind follows, or the end.
    const bool isOne = size > 0 && (bytes.size() == size ||
                                    (bytes.size() >= size + kADTSHeaderSize && frameSize(bytes.data() + size) > 0 &&
                                     (loadBE<std::uint32_t>(bytes.data()) & kADTSKindMask) ==
                                         (loadBE<std::uint32_t>(bytes.data() + size) & kADTSKindMask)));
    status = file->takeStatus(isOne);
    if (status != kStatusOK)
        return nullptr;
    std::array<std::byte, kADTSHeaderSize> header;
    std::copy_n(bytes.begin(), kADTSHeaderSize, header.begin());
    std::unique_ptr<ADTSPackets> packets(new ADTSPackets(std::move(file), start, header.data()));
    status = packets->makeFormat();
    if (status == kStatusOK)
        status = packets->countPackets();
    return status == kStatusOK ? std::move(packets) : nullptr;
}

ADTSPackets::ADTSPackets(std::unique_ptr<PacketFile> file, std::uint64_t start, const std::byte* firstHeader)
    : file_(std::move(file)),
      kind_(loadBE<std::uint32_t>(firstHeader) & kADTSKindMask),
      index_(*file_, start, startOfTrailingTags(*file_, start), [this](const std::byte* header) -> std::uint32_t {
          if ((loadBE<std::uint32_t>(header) & kADTSKindMask) != kind_)
              return 0;
          hasSeveralBlocks_ = hasSeveralBlocks_ || blocksBehindFirst(header) > 0;
          return frameSize(header);
      })
{
}

std::int32_t ADTSPackets::makeFormat()
{
    constexpr std::uint32_t kLowComplexity = 1; // one less than in the configuration
    if ((kind_ >> 14 & 3) != kLowComplexity)
        return AudioHandle::kFormatNotSupported;
    format_.formatId = fourCC("aac ");
    cookie_ = makeAACCookie(kind_ >> 10 & 15, kind_ >> 6 & 7);
    if (const std::int32_t status = readAACCookie(cookie_, format_); status != kStatusOK)
        return status;
    constexpr double kHighestReplicatedRate = 24000; // that encoders make
    return format_.sampleRate > kHighestReplicatedRate ? kStatusOK : AudioHandle::kFormatNotSupported;
}

std::int32_t ADTSPackets::countPackets()
{
    const std::int32_t status = index_.count(packetCount_);
    if (status != kStatusOK)
        return status;
    if (hasSeveralBlocks_)
        return AudioHandle::kFormatNotSupported;
    table_.validFrames = static_cast<std::int64_t>(packetCount_ * format_.framesPerPacket);
    return kStatusOK;
}

std::uint64_t ADTSPackets::preRoll(std::uint64_t packet)
{
    return constantPreRoll(format_.formatId, packet);
}

std::int32_t ADTSPackets::read(std::uint64_t packet, Bytes& bytes)
{
    FrameIndex::Place place;
    if (const std::int32_t status = index_.find(packet, place); status != kStatusOK)
        return status;
    const BytesView header = file_->at(place.position, kADTSHeaderSize); // find() recognized them
    const bool hasCRC = (loadBE<std::uint32_t>(header.data()) & kNoCRC) == 0;
    const std::uint32_t headerSize = kADTSHeaderSize + (hasCRC ? kADTSCRCSize : 0);
    return file_->read(place.position + headerSize, place.size - headerSize, bytes);
}

} // namespace platform
