// The packets of the audio track in an MP4, M4A or MOV file (ISO/IEC 14496-12, -14).
#pragma once

#include "media/packets/MP4Boxes.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketSource.h"
#include "media/packets/SampleTable.h"

namespace platform {

/// The first audio track, whatever stands beside it: AAC-LC and ALAC. Other codings, fragmented files, and edits other
/// than one that cuts the start and the end are for a general demultiplexer; but sounds that are locked, and those of
/// the ids "sac1" and "sal1", are here by their ids, so that no demultiplexer is asked for them. Packets that a file
/// has lost at its end are not counted.
class M4APackets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported when the file is of another kind. `file` is taken over when it is one.
    static std::unique_ptr<PacketSource> open(std::unique_ptr<PacketFile>& file, std::int32_t& status);

    const StreamDescription& format() const override { return format_; }
    FourCC fileType() const override { return fileType_; }
    BytesView cookie() const override { return cookie_; }
    const PacketTable& table() const override { return table_; }
    std::uint64_t packetCount() const override { return samples_.packets.count(); }
    SoundFacts facts() const override { return facts_; }
    std::uint64_t preRoll(std::uint64_t packet) override;
    std::int32_t read(std::uint64_t packet, Bytes& bytes) override;

private:
    struct Track;

    explicit M4APackets(std::unique_ptr<PacketFile> file) : file_(std::move(file)) {}
    std::int32_t readMovie();
    std::int32_t findTrack(const MP4Box& movie, Track& track);
    std::int32_t readSampleEntry(const MP4Box& descriptions);
    std::int32_t makeTable(const MP4Box& movie, const Track& track);

    std::unique_ptr<PacketFile> file_;
    FourCC fileType_ = fourCC("mp4f");
    StreamDescription format_;
    Bytes cookie_;
    SampleTable samples_;
    PacketTable table_;
    SoundFacts facts_;
};

} // namespace platform
