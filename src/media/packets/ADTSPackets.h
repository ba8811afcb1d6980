// The packets of AAC in an audio data transport stream (ADTS; ISO/IEC 13818-7, 6.2, and 14496-3, 1.A.2).
#pragma once

#include "media/packets/AudioCookie.h"
#include "media/packets/FrameIndex.h"
#include "media/packets/PacketSource.h"

namespace platform {

/// AAC-LC above 24 kHz, a raw data block in each frame. At lower rates the decoder may find spectral band replication,
/// which only the packets' insides tell, and twice the frames; such a file is for a general demultiplexer, and so are
/// channels that no number names and several blocks in a frame. A packet is what stands behind a frame's header. The
/// first frame decides on rate and channels; frames of another kind are passed over.
class ADTSPackets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported when the file is of another kind. `file` is taken over when it is one.
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
    std::uint32_t kind_;            // what the headers of all frames have in common
    bool hasSeveralBlocks_ = false; // any frame
    FrameIndex index_;
    StreamDescription format_;
    Bytes cookie_;
    PacketTable table_;
    std::uint64_t packetCount_ = 0;
};

} // namespace platform
