// The packets of a CAF file (published format description, version 1.0) whose sound is not linear PCM.
#pragma once

#include "media/containers/AudioDescription.h"
#include "media/containers/ContainerLayout.h"
#include "media/packets/MPEGFrameHeader.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketIndex.h"
#include "media/packets/PacketSource.h"

#include <optional>

namespace platform {

/// AAC-LC, ALAC, MP3 and IMA 4:1 in packets of one length. Other codings need a general demultiplexer, except those
/// that nothing here decodes, which are reported by their ids. Packets of one size need no packet table; if there is
/// one, it tells which frames belong to the sound. Packets missing at the file's end do not count.
class CAFPackets final : public PacketSource {
public:
    /// Null, with `status` kFormatNotSupported if the file is of another kind. Takes ownership of `file` only if it is
    /// not.
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
    std::optional<MPEGFrameHeader> mpeg_; // for MP3: header of the first packet
    Bytes cookie_;
    PacketIndex index_;
    PacketTable table_;
    SoundFacts facts_;
};

} // namespace platform
