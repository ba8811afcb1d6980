// The packets of a CAF file (published format description, version 1.0) that holds no linear PCM.
#pragma once

#include "media/containers/AudioDescription.h"
#include "media/containers/ContainerLayout.h"
#include "media/packets/MPEGFrameHeader.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketIndex.h"
#include "media/packets/PacketSource.h"

#include <optional>

namespace platform {

/// AAC-LC, ALAC, MP3 and IMA 4:1, in packets that all have as many frames; other codings are for a general
/// demultiplexer, but for those that nothing here decodes, which are here by their ids. Packets of one size need no
/// packet table; one that is there then says which frames are sound. Packets that a file has lost at its end are not
/// counted.
class CAFPackets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported when the file is of another kind. `file` is taken over when it is one.
    static std::unique_ptr<PacketSource> open(std::unique_ptr<PacketFile>& file, std::int32_t& status);

    const StreamDescription& format() const override { return format_; }
    FourCC fileType() const override { return fourCC("caff"); }
    BytesView cookie() const override { return cookie_; }
    const PacketTable& table() const override { return table_; }
    std::uint64_t packetCount() const override { return index_.count(); }
    SoundFacts facts() const override { return facts_; }
    std::uint64_t preRoll(std::uint64_t packet) override;
    std::int32_t read(std::uint64_t packet, Bytes& bytes) override;

private:
    explicit CAFPackets(std::unique_ptr<PacketFile> file) : file_(std::move(file)) {}
    std::int32_t readChunks();
    std::int32_t readCookie(const ContainerLayout& layout);
    std::int32_t checkCoding();
    std::int32_t readPackets(const ContainerLayout& layout, const AudioDescription& audio);
    std::int32_t readSizes(std::uint64_t position, std::uint64_t end, std::uint64_t count);

    std::unique_ptr<PacketFile> file_;
    StreamDescription format_;
    std::optional<MPEGFrameHeader> mpeg_; // of MP3: that of the first packet
    Bytes cookie_;
    PacketIndex index_;
    PacketTable table_;
    SoundFacts facts_;
};

} // namespace platform
