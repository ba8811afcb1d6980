#include "media/packets/CAFPackets.h"

#include "media/packets/AudioCookie.h"
#include "media/packets/Codings.h"
#include "media/packets/Reservoir.h"
#include "media/packets/TrackTable.h"
#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

constexpr std::uint64_t kLargestCookie = 4096;
constexpr std::uint64_t kTableHeaderSize = 24; // of "pakt": packets 8, valid frames 8, priming 4, remainder 4

std::uint64_t notNegative(std::int64_t number)
{
    return static_cast<std::uint64_t>(std::max<std::int64_t>(number, 0));
}

/// Strips the boxes that some writers put around the configuration of ALAC: an atom "frma" and the header of an atom
/// "alac".
void unwrapALAC(Bytes& cookie)
{
    constexpr std::ptrdiff_t kWrapperSize = 12; // both: size, type and four bytes
    for (const FourCC type : {fourCC("frma"), fourCC("alac")})
        if (cookie.size() >= kWrapperSize && loadBE<FourCC>(cookie.data() + 4) == type)
            cookie.erase(cookie.begin(), cookie.begin() + kWrapperSize);
}

} // namespace

std::unique_ptr<PacketSource> CAFPackets::open(std::unique_ptr<PacketFile>& file, std::int32_t& status)
{
    const BytesView id = file->at(0, 4);
    const bool isOne = id.size() == 4 && loadBE<FourCC>(id.data()) == fourCC("caff");
    status = file->takeStatus(isOne);
    if (status != kStatusOK)
        return nullptr;
    std::unique_ptr<CAFPackets> packets(new CAFPackets(std::move(file)));
    status = packets->readChunks();
    if (const std::int32_t failure = packets->file_->takeStatus(); failure != kStatusOK)
        status = failure;
    return status == kStatusOK ? std::move(packets) : nullptr;
}

std::int32_t CAFPackets::readChunks()
{
    HeaderWindow window(file_->bytes(), file_->length());
    ContainerLayout layout;
    std::int32_t status = scanChunks(window, layout);
    AudioDescription audio;
    if (status == kStatusOK)
        status = describeAudio(window, layout, audio);
    if (status != kStatusOK)
        return status;
    format_ = audio.stream();
    if (format_.isLinearPCM() || format_.framesPerPacket == 0)
        return AudioHandle::kFormatNotSupported;
    status = readCookie(layout);
    if (status == kStatusOK)
        status = readPackets(layout, audio);
    return status == kStatusOK ? checkCoding() : status;
}

/// For AAC and ALAC. The cookie must agree with the description.
std::int32_t CAFPackets::readCookie(const ContainerLayout& layout)
{
    const bool isAAC = format_.formatId == fourCC("aac ");
    if (!isAAC && format_.formatId != fourCC("alac"))
        return kStatusOK;
    const Chunk* chunk = layout.find(fourCC("kuki"));
    if (chunk == nullptr || chunk->size == 0 || chunk->size > kLargestCookie)
        return kStatusIOError;
    std::int32_t status = file_->read(layout.bodyOf(*chunk), chunk->size, cookie_);
    if (status != kStatusOK)
        return status;
    const StreamDescription stated = format_;
    if (isAAC) {
        constexpr std::byte kDescriptorTag{3};
        status = cookie_[0] == kDescriptorTag ? readESDescriptor(cookie_, format_) : readAACCookie(cookie_, format_);
    } else {
        unwrapALAC(cookie_);
        status = readALACCookie(cookie_, format_);
    }
    const bool agrees = format_.sampleRate == stated.sampleRate && format_.framesPerPacket == stated.framesPerPacket;
    return status == kStatusOK && !agrees ? AudioHandle::kFormatNotSupported : status;
}

std::int32_t CAFPackets::readPackets(const ContainerLayout& layout, const AudioDescription& audio)
{
    const Chunk* chunk = layout.find(fourCC("pakt"));
    const bool hasTable = chunk != nullptr && chunk->size >= kTableHeaderSize;
    const BytesView header = hasTable ? file_->at(layout.bodyOf(*chunk), kTableHeaderSize) : BytesView{};
    ByteReader reader(header);
    const std::uint64_t count = notNegative(reader.read<std::int64_t>());
    std::uint64_t valid = notNegative(reader.read<std::int64_t>());
    const std::uint64_t priming = notNegative(reader.read<std::int32_t>());
    if (format_.bytesPerPacket > 0) {
        index_.setConstant(format_.bytesPerPacket, audio.packetCount);
    } else {
        if (!reader.ok())
            return kStatusIOError;
        const std::uint64_t start = layout.bodyOf(*chunk) + kTableHeaderSize;
        if (const std::int32_t status = readSizes(start, layout.bodyOf(*chunk) + chunk->size, count);
            status != kStatusOK)
            return status;
        const std::uint64_t there = index_.countFitting(0, index_.count(), audio.byteCount());
        if (there < count)
            facts_.promisedFrames = std::min(valid, count * format_.framesPerPacket);
        index_.cut(there);
    }
    index_.addRun(0, audio.dataOffset);
    const std::uint64_t frames = index_.count() * format_.framesPerPacket;
    valid = reader.ok() ? std::min(valid, frames) : frames;
    if (format_.formatId == fourCC("alac") && index_.count() > 0) {
        // Kept: some writers count the last packet as full.
        const PacketIndex::Place last = index_.place(index_.count() - 1);
        const BytesView start =
            file_->at(last.position, static_cast<std::size_t>(std::min<std::uint64_t>(last.size, 8)));
        const std::uint32_t missing = format_.framesPerPacket - framesOfALACPacket(start, format_.framesPerPacket);
        valid = std::min(valid, frames - missing);
    }
    return makePacketTable(frames, priming, valid, table_);
}

/// Numbers of 7 bits per byte, highest first; all bytes of a number but the last have the high bit set.
std::int32_t CAFPackets::readSizes(std::uint64_t position, std::uint64_t end, std::uint64_t count)
{
    if (count > end - position)
        return kStatusIOError;
    std::uint64_t size = 0;
    while (index_.count() < count && position < end) {
        const BytesView bytes = file_->at(
            position, static_cast<std::size_t>(std::min<std::uint64_t>(PacketFile::kMostAtOnce, end - position)));
        if (bytes.empty())
            return kStatusIOError;
        position += bytes.size();
        for (auto byte = bytes.begin(); byte != bytes.end() && index_.count() < count; ++byte) {
            size = size << 7 | std::to_integer<std::uint64_t>(*byte & std::byte{0x7F});
            if (size > PacketFile::kLargestPacket)
                return kStatusIOError;
            if ((*byte & std::byte{0x80}) != std::byte{0})
                continue;
            index_.append(static_cast<std::uint32_t>(size));
            size = 0;
        }
    }
    return index_.count() == count ? kStatusOK : kStatusIOError;
}

std::int32_t CAFPackets::checkCoding()
{
    const FourCC id = format_.formatId;
    const SoundFacts stated = factsOfCookie(format_);
    facts_.speakers = stated.speakers;
    facts_.profile = stated.profile;
    if (id != fourCC("alac"))
        format_.bitsPerChannel = 0;
    if (id == fourCC("aac ") || id == fourCC("alac") || isOpaqueCoding(id))
        return kStatusOK;
    if (id == fourCC("ima4")) {
        const bool isUsual = format_.framesPerPacket == 64 && format_.bytesPerPacket == 34 * format_.channelsPerFrame &&
                             format_.sampleRate > 0;
        return isUsual ? kStatusOK : AudioHandle::kFormatNotSupported;
    }
    if (id != fourCC(".mp3"))
        return AudioHandle::kFormatNotSupported;
    Bytes first;
    if (index_.count() > 0)
        if (const std::int32_t status = read(0, first); status != kStatusOK)
            return status;
    if (first.size() >= MPEGFrameHeader::size)
        mpeg_ = MPEGFrameHeader::parse(first.data());
    if (mpeg_)
        facts_.speakers = mpeg_->speakers();
    const bool agrees = mpeg_ && mpeg_->sampleRate == format_.sampleRate &&
                        mpeg_->channels == format_.channelsPerFrame &&
                        mpeg_->framesPerPacket() == format_.framesPerPacket;
    return agrees ? kStatusOK : AudioHandle::kFormatNotSupported;
}

std::uint64_t CAFPackets::preRoll(std::uint64_t packet)
{
    if (!mpeg_)
        return constantPreRoll(format_.formatId, packet);
    return mp3PreRoll(std::min(packet, packetCount()), *mpeg_, [&](std::uint64_t i) {
        MPEGFrameHeader header = *mpeg_;
        header.frameSize = static_cast<std::uint16_t>(std::min<std::uint64_t>(index_.place(i).size, UINT16_MAX));
        return header.mainDataSize();
    });
}

std::int32_t CAFPackets::read(std::uint64_t packet, Bytes& bytes)
{
    if (packet >= packetCount())
        return kStatusEndOfFile;
    const PacketIndex::Place place = index_.place(packet);
    return file_->read(place.position, place.size, bytes);
}

} // namespace platform
