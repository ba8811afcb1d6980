#include "media/packets/MP3Packets.h"

#include "media/packets/Reservoir.h"
#include "media/packets/TagExtents.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <utility>

namespace platform {

namespace {

constexpr std::uint64_t kMostJunkAhead = std::uint64_t{1} << 16;
constexpr std::uint64_t kMostZerosAhead = std::uint64_t{1} << 20;
constexpr int kRunBehindJunk = 8; // frames that must follow each other to be believed
constexpr int kRunAtStart = 2;
constexpr std::uint32_t kDecoderDelay = 529; // frames, of every decoder of layer III

/// Containers that may hold MP3 packets, a few in a row, which are not to be taken for a bare stream.
bool isContainer(BytesView start)
{
    constexpr std::array ids = {fourCC("RIFF"),     fourCC("RIFX"),     fourCC("FORM"),    fourCC("caff"),
                                fourCC("OggS"),     fourCC("fLaC"),     fourCC(".RMF"),    fourCC("FLV\1"),
                                FourCC{0x1A45DFA3}, FourCC{0x3026B275}, FourCC{0x000001BA}};
    return start.size() >= 8 && (std::ranges::find(ids, loadBE<FourCC>(start.data())) != ids.end() ||
                                 loadBE<FourCC>(start.data() + 4) == fourCC("ftyp"));
}

/// The header at the start of `bytes` when `run` frames of a stream follow each other there, the last of them seen
/// by its header at least; or fewer up to the end of the file.
std::optional<MPEGFrameHeader> headerOfRun(BytesView bytes, int run, bool reachesEnd)
{
    if (bytes.size() < FrameIndex::kHeaderSize)
        return {};
    const std::optional<MPEGFrameHeader> first = MPEGFrameHeader::parse(bytes.data());
    if (!first)
        return {};
    std::size_t position = first->frameSize;
    for (int count = 1; count < run; ++count) {
        if (position + FrameIndex::kHeaderSize > bytes.size())
            return reachesEnd && position == bytes.size() ? first : std::nullopt;
        const auto next = MPEGFrameHeader::parse(bytes.data() + position);
        if (!next || !next->belongsWith(*first))
            return {};
        position += next->frameSize;
    }
    return first;
}

std::uint64_t endOfZeros(PacketFile& file, std::uint64_t position)
{
    const std::uint64_t limit = position + kMostZerosAhead;
    while (position < limit) {
        const BytesView bytes = file.at(position, PacketFile::kMostAtOnce);
        const auto found = std::ranges::find_if(bytes, [](std::byte byte) { return byte != std::byte{0}; });
        position += static_cast<std::uint64_t>(found - bytes.begin());
        if (bytes.empty() || found != bytes.end())
            break;
    }
    return position;
}

} // namespace

struct MP3Packets::Start {
    std::uint64_t position = 0;
    std::optional<MPEGFrameHeader> header; // none: the file is no MP3
    std::optional<MP3Info> info;

    std::uint64_t soundPosition() const { return position + (info ? header->frameSize : 0); }
};

MP3Packets::Start MP3Packets::findStart(PacketFile& file)
{
    Start start;
    const std::uint64_t tagEnd = endOfLeadingTags(file);
    if (isContainer(file.at(tagEnd, 8)))
        return start;
    start.position = endOfZeros(file, tagEnd);
    BytesView bytes = file.at(start.position, PacketFile::kMostAtOnce);
    const auto reachesEnd = [&](std::uint64_t position) { return position + bytes.size() == file.length(); };
    if (bytes.size() >= FrameIndex::kHeaderSize) {
        start.header = MPEGFrameHeader::parse(bytes.data());
        if (start.header)
            start.info = MP3Info::parse(*start.header,
                                        bytes.first(std::min<std::size_t>(bytes.size(), start.header->frameSize)));
        if (!start.info)
            start.header = headerOfRun(bytes, kRunAtStart, reachesEnd(start.position));
    }
    // Else the first frame is looked for a little further on.
    for (const std::uint64_t limit = start.position + kMostJunkAhead; !start.header && start.position < limit;) {
        bytes = file.at(++start.position, PacketFile::kMostAtOnce / 2);
        const void* sync = bytes.empty() ? nullptr : std::memchr(bytes.data(), 0xFF, bytes.size());
        if (sync == nullptr && (bytes.empty() || reachesEnd(start.position)))
            break;
        const std::size_t skipped = sync == nullptr
                                        ? bytes.size() - 1
                                        : static_cast<std::size_t>(static_cast<const std::byte*>(sync) - bytes.data());
        start.position += skipped;
        bytes = file.at(start.position, PacketFile::kMostAtOnce / 2);
        start.header = headerOfRun(bytes, kRunBehindJunk, reachesEnd(start.position));
        if (start.header)
            start.info = MP3Info::parse(*start.header, bytes.first(start.header->frameSize));
    }
    return start;
}

std::unique_ptr<PacketSource> MP3Packets::open(std::unique_ptr<PacketFile>& file, std::int32_t& status)
{
    const Start start = findStart(*file);
    status = file->takeStatus(start.header.has_value());
    if (status != kStatusOK)
        return nullptr;
    const std::uint64_t end = startOfTrailingTags(*file, start.position);
    std::unique_ptr<MP3Packets> packets(new MP3Packets(std::move(file), start, end));
    status = packets->countPackets(start, end);
    if (status != kStatusOK)
        return nullptr;
    packets->makeTable(start.info.value_or(MP3Info{}), end - start.position);
    return packets;
}

/// The header of the first frame that is sound. Writers of the frame ahead of it may take other channels for that.
MPEGFrameHeader MP3Packets::firstOfSound(PacketFile& file, const Start& start)
{
    const BytesView bytes = file.at(start.soundPosition(), MPEGFrameHeader::size);
    const auto header = bytes.size() < MPEGFrameHeader::size ? std::nullopt : MPEGFrameHeader::parse(bytes.data());
    return header.value_or(*start.header);
}

MP3Packets::MP3Packets(std::unique_ptr<PacketFile> file, const Start& start, std::uint64_t end)
    : file_(std::move(file)),
      first_(firstOfSound(*file_, start)),
      index_(*file_, start.soundPosition(), end, [first = first_](const std::byte* bytes) -> std::uint32_t {
          const auto header = MPEGFrameHeader::parse(bytes);
          return header && header->belongsWith(first) ? header->frameSize : 0;
      })
{
    format_.formatId = fourCC(".mp3");
    format_.sampleRate = first_.sampleRate;
    format_.channelsPerFrame = first_.channels;
    format_.framesPerPacket = first_.framesPerPacket();
    facts_.speakers = first_.speakers();
}

/// The header's count is taken when its bytes are those that are there and could be so many frames.
std::int32_t MP3Packets::countPackets(const Start& start, std::uint64_t end)
{
    const MP3Info info = start.info.value_or(MP3Info{});
    if (info.frameCount && info.byteCount && *info.byteCount == end - start.position) {
        const std::uint64_t bytes = end - std::min(end, start.soundPosition());
        const std::uint64_t count = *info.frameCount;
        if (count * first_.smallestFrame() <= bytes && bytes <= count * first_.largestFrame()) {
            packetCount_ = count;
            return kStatusOK;
        }
    }
    return index_.count(packetCount_);
}

/// `byteCount` are the bytes from the first frame on.
void MP3Packets::makeTable(const MP3Info& info, std::uint64_t byteCount)
{
    const auto frames = static_cast<std::int64_t>(packetCount_ * format_.framesPerPacket);
    if (info.padding) {
        // What the decoder delays comes out of the padding. Of a file that was cut the padding is gone.
        const bool isWhole = !info.frameCount || *info.frameCount == packetCount_;
        const auto padding = static_cast<std::int32_t>(info.padding->padding);
        table_.primingFrames = static_cast<std::int32_t>(info.padding->delay + kDecoderDelay);
        table_.remainderFrames = isWhole ? std::max<std::int32_t>(0, padding - std::int32_t{kDecoderDelay}) : 0;
    }
    table_.validFrames = std::max<std::int64_t>(0, frames - table_.primingFrames - table_.remainderFrames);
    // Some writers count the frame that says so, too: bytes that are all there tell.
    if (info.frameCount && *info.frameCount > packetCount_ && byteCount < info.byteCount.value_or(UINT32_MAX)) {
        const std::uint64_t promised = std::uint64_t{*info.frameCount} * format_.framesPerPacket;
        const std::uint64_t padding = info.padding ? std::uint64_t{info.padding->delay} + info.padding->padding : 0;
        facts_.promisedFrames = promised - std::min(padding, promised);
    }
}

std::uint64_t MP3Packets::preRoll(std::uint64_t packet)
{
    constexpr std::uint64_t kUsually = 16;
    packet = std::min(packet, packetCount_);
    FrameIndex::Place place;
    if (packet == 0 || index_.find(packet - 1, place) != kStatusOK)
        return std::min(packet, kUsually); // read() will tell
    // Brings what is asked for backwards into the window, from its first byte on.
    const std::uint64_t from = index_.position(packet - std::min(packet, kUsually));
    const auto size =
        static_cast<std::size_t>(std::min<std::uint64_t>(PacketFile::kMostAtOnce, place.position + place.size - from));
    file_->at(from, size);
    const std::uint64_t ahead = mp3PreRoll(packet, first_, [&](std::uint64_t i) -> std::uint32_t {
        const BytesView bytes = file_->at(index_.position(i), MPEGFrameHeader::size);
        const auto header = bytes.size() < MPEGFrameHeader::size ? std::nullopt : MPEGFrameHeader::parse(bytes.data());
        return header ? header->mainDataSize() : 0;
    });
    file_->takeStatus(); // what cannot be read, read() tells
    return ahead;
}

std::int32_t MP3Packets::read(std::uint64_t packet, Bytes& bytes)
{
    FrameIndex::Place place;
    if (packet >= packetCount_)
        return kStatusEndOfFile;
    const std::int32_t status = index_.find(packet, place);
    return status == kStatusOK ? file_->read(place.position, place.size, bytes) : status;
}

} // namespace platform
