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
constexpr int kRunBehindJunk = 8; // frames in a row that make a stream credible
constexpr int kRunAtStart = 2;
constexpr std::uint32_t kDecoderDelay = 529; // frames, in every layer III decoder

/// Containers that may hold a few MP3 packets in a row, and must not be taken for a bare stream.
bool isContainer(BytesView start)
{
    constexpr std::array ids = {fourCC("RIFF"),  fourCC("RIFX"),     fourCC("FORM"),     fourCC("caff"),
                                fourCC("OggS"),  fourCC("fLaC"),     fourCC("wvpk"),     fourCC(".RMF"),
                                fourCC("FLV\1"), FourCC{0x1A45DFA3}, FourCC{0x3026B275}, FourCC{0x000001BA}};
    return start.size() >= 8 && (std::ranges::find(ids, loadBE<FourCC>(start.data())) != ids.end() ||
                                 loadBE<FourCC>(start.data() + 4) == fourCC("ftyp"));
}

/// The header at the start of `bytes` if `run` frames of a stream follow each other there, of the last of which at
/// least the header is in view; fewer suffice at the end of the file.
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

struct Run {
    std::uint64_t position = 0;
    MPEGFrameHeader header;
};

/// The first credible run of frames between two positions.
std::optional<Run> findRun(PacketFile& file, std::uint64_t position, std::uint64_t limit)
{
    constexpr std::size_t kPiece = PacketFile::kMostAtOnce / 2;
    for (; position < limit; ++position) {
        BytesView bytes = file.at(position, kPiece);
        if (bytes.empty())
            break;
        const void* sync = std::memchr(bytes.data(), 0xFF, bytes.size());
        if (sync == nullptr) {
            position += bytes.size() - 1;
            continue;
        }
        position += static_cast<std::size_t>(static_cast<const std::byte*>(sync) - bytes.data());
        bytes = file.at(position, kPiece);
        if (const auto header = headerOfRun(bytes, kRunBehindJunk, position + bytes.size() == file.length()))
            return Run{position, *header};
    }
    return {};
}

} // namespace

struct MP3Packets::Start {
    std::uint64_t position = 0;
    std::optional<MPEGFrameHeader> header; // none if the file is no MP3
    std::optional<MP3Info> info;
    std::optional<MPEGFrameHeader> sound; // of the frames that are sound

    std::uint64_t soundPosition() const { return position + (info ? header->frameSize : 0); }
};

/// The frame at `position`, if it describes the others or begins `run` frames of a stream.
MP3Packets::Start MP3Packets::startAt(PacketFile& file, std::uint64_t position, int run)
{
    Start start;
    start.position = position;
    const BytesView bytes = file.at(position, PacketFile::kMostAtOnce);
    if (bytes.size() < FrameIndex::kHeaderSize)
        return start;
    start.header = MPEGFrameHeader::parse(bytes.data());
    if (start.header)
        start.info =
            MP3Info::parse(*start.header, bytes.first(std::min<std::size_t>(bytes.size(), start.header->frameSize)));
    if (!start.info)
        start.header = headerOfRun(bytes, run, position + bytes.size() == file.length());
    start.sound = start.header;
    return start;
}

/// A header at the start may be chance, and that of a damaged frame wrong, so it is trusted only if frames that belong
/// to it follow; otherwise the first frames that follow each other decide.
MP3Packets::Start MP3Packets::findStart(PacketFile& file)
{
    const std::uint64_t tagEnd = endOfLeadingTags(file);
    if (isContainer(file.at(tagEnd, 8)))
        return {};
    Start start = startAt(file, endOfZeros(file, tagEnd), kRunAtStart);
    if (start.header) {
        // The writer of the frame before the sound may give it other channels.
        const BytesView bytes = file.at(start.soundPosition(), PacketFile::kMostAtOnce);
        const bool reachesEnd = start.soundPosition() + bytes.size() == file.length();
        const auto sound = headerOfRun(bytes, start.info ? kRunAtStart : kRunBehindJunk, reachesEnd);
        if (sound) {
            start.sound = sound;
            return start;
        }
        if (start.info && bytes.size() >= MPEGFrameHeader::size)
            start.sound = MPEGFrameHeader::parse(bytes.data());
    }
    const auto run = findRun(file, start.position + 1, start.position + kMostJunkAhead);
    if (run && start.header && run->header.belongsWith(*start.header))
        start.sound = start.header;
    else if (run)
        start = startAt(file, run->position, kRunBehindJunk);
    if (start.header && !start.sound)
        start.sound = start.header;
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

MP3Packets::MP3Packets(std::unique_ptr<PacketFile> file, const Start& start, std::uint64_t end)
    : file_(std::move(file)),
      first_(*start.sound),
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

/// Trusts the header's count if its byte count matches and allows for so many frames.
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

/// `byteCount` counts from the first frame.
void MP3Packets::makeTable(const MP3Info& info, std::uint64_t byteCount)
{
    const auto frames = static_cast<std::int64_t>(packetCount_ * format_.framesPerPacket);
    if (info.padding) {
        // The decoder's delay comes out of the padding, which is gone if the file was cut.
        const bool isWhole = !info.frameCount || *info.frameCount == packetCount_;
        const auto padding = static_cast<std::int32_t>(info.padding->padding);
        table_.primingFrames = static_cast<std::int32_t>(info.padding->delay + kDecoderDelay);
        table_.remainderFrames = isWhole ? std::max<std::int32_t>(0, padding - std::int32_t{kDecoderDelay}) : 0;
    }
    table_.validFrames = std::max<std::int64_t>(0, frames - table_.primingFrames - table_.remainderFrames);
    // Some writers count the describing frame too, which shows if all bytes are present.
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
        return std::min(packet, kUsually); // read() reports the failure
    // Loads what is asked for backwards into the window, from its first byte.
    const std::uint64_t from = index_.position(packet - std::min(packet, kUsually));
    const auto size =
        static_cast<std::size_t>(std::min<std::uint64_t>(PacketFile::kMostAtOnce, place.position + place.size - from));
    file_->at(from, size);
    const std::uint64_t ahead = mp3PreRoll(packet, first_, [&](std::uint64_t i) -> std::uint32_t {
        const BytesView bytes = file_->at(index_.position(i), MPEGFrameHeader::size);
        const auto header = bytes.size() < MPEGFrameHeader::size ? std::nullopt : MPEGFrameHeader::parse(bytes.data());
        return header ? header->mainDataSize() : 0;
    });
    file_->takeStatus(); // read() reports what cannot be read
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
