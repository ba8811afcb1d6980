// The packets of AAC in an audio data transport stream (ADTS; ISO/IEC 13818-7, 6.2, and 14496-3, 1.A.2).
#pragma once

#include "media/packets/AudioCookie.h"
#include "media/packets/FrameIndex.h"
#include "media/packets/PacketSource.h"

namespace platform {

/// AAC-LC above 24 kHz, one raw data block per frame. At lower rates a decoder may find spectral band replication,
/// which only the packets' content tells and which doubles the frames; such a file needs a general demultiplexer, and
/// so do channels without a configuration number and several blocks per frame. A packet is what follows a frame's
/// header. The first frame decides on rate and channels; frames of another kind are skipped.
class ADTSPackets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported if the file is of another kind. Takes ownership of `file` only if it is
    /// not.
    static std::unique_ptr<PacketSource> open(std::unique_ptr<PacketFile>& file, std::int32_t& status);

    const StreamDescription& format() const override { return format_; }
    FourCC fileType() const override { return fourCC("adts"); }
    BytesView cookie() const override { return cookie_; }
    const PacketTable& table() const override { return table_; }
    std::uint64_t packetCount() const override { return packetCount_; }
    SoundFacts facts() const override { return factsOfCookie(format_); }
    std::uint64_t preRoll(std::uint64_t packet) override;
    std::int32_t read(std::uint64_t packet, Bytes& bytes) override;

private:
    ADTSPackets(std::unique_ptr<PacketFile> file, std::uint64_t start, const std::byte* firstHeader);
    std::int32_t countPackets();
    std::int32_t makeFormat();

    std::unique_ptr<PacketFile> file_;
    std::uint32_t kind_;            // the bits that all headers share
    bool hasSeveralBlocks_ = false; // in any frame
    FrameIndex index_;
    StreamDescription format_;
    Bytes cookie_;
    PacketTable table_;
    std::uint64_t packetCount_ = 0;
};

} // namespace platform
