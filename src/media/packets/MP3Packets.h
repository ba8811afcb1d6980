// The packets of an MP3 file: MPEG-1, MPEG-2 and MPEG-2.5 audio, layer III.
#pragma once

#include "media/packets/FrameIndex.h"
#include "media/packets/MP3Info.h"
#include "media/packets/MPEGFrameHeader.h"
#include "media/packets/PacketSource.h"

namespace platform {

/// The first sound frame that others follow decides on version, sample rate and channels; frames of another kind are
/// skipped like other foreign bytes. A packet is a whole frame with its header.
class MP3Packets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported if the file is no MP3. Takes ownership of `file` only if it is.
    static std::unique_ptr<PacketSource> open(std::unique_ptr<PacketFile>& file, std::int32_t& status);

    const StreamDescription& format() const override { return format_; }
    FourCC fileType() const override { return fourCC("MPG3"); }
    BytesView cookie() const override { return {}; }
    const PacketTable& table() const override { return table_; }
    std::uint64_t packetCount() const override { return packetCount_; }
    SoundFacts facts() const override { return facts_; }
    std::uint64_t preRoll(std::uint64_t packet) override;
    std::int32_t read(std::uint64_t packet, Bytes& bytes) override;

private:
    struct Start; // where the frames begin, and what the first one says
    static Start findStart(PacketFile& file);
    static Start startAt(PacketFile& file, std::uint64_t position, int run);
    MP3Packets(std::unique_ptr<PacketFile> file, const Start& start, std::uint64_t end);
    std::int32_t countPackets(const Start& start, std::uint64_t end);
    void makeTable(const MP3Info& info, std::uint64_t byteCount);

    std::unique_ptr<PacketFile> file_;
    MPEGFrameHeader first_;
    FrameIndex index_;
    StreamDescription format_;
    PacketTable table_;
    SoundFacts facts_;
    std::uint64_t packetCount_ = 0;
};

} // namespace platform
