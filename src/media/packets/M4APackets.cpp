#include "media/packets/M4APackets.h"

#include "media/packets/AudioCookie.h"
#include "media/packets/Codings.h"
#include "media/packets/EditList.h"
#include "media/packets/TrackTable.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform {

namespace {

constexpr std::size_t kLargestM4ACookie = 4096;

bool isMovie(PacketFile& file)
{
    constexpr std::array types = {fourCC("ftyp"), fourCC("moov"), fourCC("mdat"), fourCC("wide"),
                                  fourCC("free"), fourCC("skip"), fourCC("pnot")};
    MP4Box first;
    return MP4Boxes(file, 0, file.length()).next(first) && std::ranges::find(types, first.type) != types.end();
}

FourCC fileTypeOf(FourCC brand)
{
    const bool isAudio = brand == fourCC("M4A ") || brand == fourCC("M4B ") || brand == fourCC("M4P ");
    return isAudio ? fourCC("m4af") : fourCC("mp4f");
}

/// Units per second from a box "mdhd" or "mvhd"; 0 if there is none.
std::uint32_t timescaleOf(PacketFile& file, const std::optional<MP4Box>& header)
{
    if (!header || header->size() < 24)
        return 0;
    const BytesView fields = file.at(header->body, 24);
    if (fields.size() < 24)
        return 0;
    return loadBE<std::uint32_t>(fields.data() + (fields[0] == std::byte{1} ? 20 : 12)); // after dates of 64 or 32 bits
}

} // namespace

struct M4APackets::Track {
    MP4Box box;
    MP4Box samples; // "stbl"
    std::uint32_t timescale = 0;
};

std::unique_ptr<PacketSource> M4APackets::open(std::unique_ptr<PacketFile>& file, std::int32_t& status)
{
    const bool isOne = isMovie(*file);
    status = file->takeStatus(isOne);
    if (status != kStatusOK)
        return nullptr;
    std::unique_ptr<M4APackets> packets(new M4APackets(std::move(file)));
    status = packets->readMovie();
    if (const std::int32_t failure = packets->file_->takeStatus(); failure != kStatusOK)
        status = failure;
    return status == kStatusOK ? std::move(packets) : nullptr;
}

std::int32_t M4APackets::readMovie()
{
    std::optional<MP4Box> movie;
    MP4Box box;
    for (MP4Boxes boxes(*file_, 0, file_->length()); boxes.next(box);) {
        if (box.type == fourCC("moof"))
            return AudioHandle::kFormatNotSupported;
        if (box.type == fourCC("moov") && !movie)
            movie = box;
        const BytesView brand = box.type == fourCC("ftyp") ? file_->at(box.body, 4) : BytesView{};
        if (brand.size() == 4)
            fileType_ = fileTypeOf(loadBE<FourCC>(brand.data()));
    }
    if (!movie)
        return kStatusIOError;
    if (MP4Boxes(*file_, *movie).find(fourCC("mvex")))
        return AudioHandle::kFormatNotSupported;
    Track track;
    std::int32_t status = findTrack(*movie, track);
    const auto descriptions = MP4Boxes(*file_, track.samples).find(fourCC("stsd"));
    if (status == kStatusOK)
        status = descriptions ? readSampleEntry(*descriptions) : kStatusIOError;
    if (status == kStatusOK)
        status = SampleTable::read(*file_, track.samples, samples_);
    return status == kStatusOK ? makeTable(*movie, track) : status;
}

std::int32_t M4APackets::findTrack(const MP4Box& movie, Track& track)
{
    facts_.tracks = 0;
    MP4Boxes boxes(*file_, movie);
    while (const auto box = boxes.find(fourCC("trak"))) {
        const auto media = MP4Boxes(*file_, *box).find(fourCC("mdia"));
        const auto handler = media ? MP4Boxes(*file_, *media).find(fourCC("hdlr")) : std::nullopt;
        const BytesView kind = handler && handler->size() >= 12 ? file_->at(handler->body + 8, 4) : BytesView{};
        if (kind.size() < 4 || loadBE<FourCC>(kind.data()) != fourCC("soun"))
            continue;
        if (++facts_.tracks > 1)
            continue;
        const auto information = MP4Boxes(*file_, *media).find(fourCC("minf"));
        const auto samples = information ? MP4Boxes(*file_, *information).find(fourCC("stbl")) : std::nullopt;
        track.timescale = timescaleOf(*file_, MP4Boxes(*file_, *media).find(fourCC("mdhd")));
        if (!samples || track.timescale == 0)
            return kStatusIOError;
        track.box = *box;
        track.samples = *samples;
    }
    return facts_.tracks > 0 ? kStatusOK : AudioHandle::kFormatNotSupported;
}

/// Sets format and cookie from the first entry of "stsd".
std::int32_t M4APackets::readSampleEntry(const MP4Box& descriptions)
{
    constexpr std::uint64_t kFieldsSize = 28; // MOV adds 16 in version 1, 36 in version 2
    MP4Box entry;
    if (!MP4Boxes(*file_, descriptions, 8).next(entry))
        return kStatusIOError;
    const BytesView fields = file_->at(entry.body, kFieldsSize);
    if (entry.size() < kFieldsSize || fields.size() < kFieldsSize)
        return kStatusIOError;
    format_.formatId = entry.type;
    const auto version = loadBE<std::uint16_t>(fields.data() + 8);
    format_.channelsPerFrame = loadBE<std::uint16_t>(fields.data() + 16);
    format_.sampleRate = loadBE<std::uint32_t>(fields.data() + 24) / 65536.0;
    if (isOpaqueCoding(entry.type))
        return kStatusOK;
    const bool isAAC = entry.type == fourCC("mp4a");
    if (!isAAC && entry.type != fourCC("alac"))
        return AudioHandle::kFormatNotSupported;
    const FourCC wanted = isAAC ? fourCC("esds") : fourCC("alac");
    const std::uint64_t fieldsSize = kFieldsSize + (version == 1 ? 16 : version == 2 ? 36 : 0);
    auto box = MP4Boxes(*file_, entry, fieldsSize).find(wanted);
    if (!box)
        if (const auto wave = MP4Boxes(*file_, entry, fieldsSize).find(fourCC("wave")))
            box = MP4Boxes(*file_, *wave).find(wanted);
    constexpr std::uint64_t kVersionSize = 4; // version and flags
    if (!box || box->size() < kVersionSize || box->size() > kLargestM4ACookie)
        return kStatusIOError;
    const std::uint64_t size = box->size() - kVersionSize;
    if (const std::int32_t status = file_->read(box->body + kVersionSize, size, cookie_); status != kStatusOK)
        return status;
    format_.formatId = isAAC ? fourCC("aac ") : fourCC("alac");
    return isAAC ? readESDescriptor(cookie_, format_) : readALACCookie(cookie_, format_);
}

std::int32_t M4APackets::makeTable(const MP4Box& movie, const Track& track)
{
    if (isOpaqueCoding(format_.formatId)) {
        format_.framesPerPacket = samples_.duration;
        table_.validFrames = static_cast<std::int64_t>(samples_.totalDuration());
        return kStatusOK;
    }
    const bool isInFrames = track.timescale == format_.sampleRate &&
                            (samples_.duration == format_.framesPerPacket || samples_.packets.count() == 0 ||
                             (samples_.statedPackets == 1 && samples_.duration < format_.framesPerPacket));
    if (!isInFrames)
        return AudioHandle::kFormatNotSupported;
    TrackFrames frames;
    frames.inPackets = samples_.packets.count() * format_.framesPerPacket;
    frames.stated = std::min(samples_.totalDuration(), frames.inPackets);
    frames.inListed = samples_.statedPackets * format_.framesPerPacket;
    frames.perPacket = format_.framesPerPacket;
    frames.sampleRate = track.timescale;
    frames.movieTimescale = timescaleOf(*file_, MP4Boxes(*file_, movie).find(fourCC("mvhd")));
    frames.gapless = readGaplessItem(*file_, movie);
    if (const std::int32_t status = readEditList(*file_, track.box, frames.edit); status != kStatusOK)
        return status;
    if (const std::int32_t status = makePacketTable(frames, table_); status != kStatusOK)
        return status;
    const SoundFacts stated = factsOfCookie(format_);
    facts_.speakers = stated.speakers;
    facts_.profile = stated.profile;
    if (samples_.packets.count() < samples_.statedPackets) {
        frames.inPackets = frames.inListed;
        frames.stated = std::min(samples_.statedDuration(), frames.inListed);
        PacketTable promised;
        if (makePacketTable(frames, promised) == kStatusOK)
            facts_.promisedFrames = static_cast<std::uint64_t>(promised.validFrames);
    }
    return kStatusOK;
}

std::uint64_t M4APackets::preRoll(std::uint64_t packet)
{
    return constantPreRoll(format_.formatId, packet);
}

std::int32_t M4APackets::read(std::uint64_t packet, Bytes& bytes)
{
    if (packet >= samples_.packets.count())
        return kStatusEndOfFile;
    const PacketIndex::Place place = samples_.packets.place(packet);
    return file_->read(place.position, place.size, bytes);
}

} // namespace platform
