// The packets of the audio track in an MP4, M4A or MOV file (ISO/IEC 14496-12, -14).
#pragma once

#include "media/packets/MP4Boxes.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketSource.h"
#include "media/packets/SampleTable.h"

namespace platform {

/// The first audio track, whatever else there is: AAC-LC and ALAC. Other codings, fragmented files, and edits that do
/// more than cut start and end need a general demultiplexer, except protected sound and the ids "sac1" and "sal1",
/// which are reported by their ids so that no demultiplexer is asked. Packets missing at the file's end do not count.
class M4APackets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported if the file is of another kind. Takes ownership of `file` only if it is
    /// not.
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
