// Decodes packets that the library found itself.
#pragma once

#include "media/ffmpeg/Codec.h"
#include "media/ffmpeg/SpanDecoder.h"
#include "media/packets/PacketSource.h"

#include <memory>

namespace platform::ffmpeg {

/// Packet p always has the frames from p x framesPerPacket on: a packet that does not decode becomes silence, and one
/// of another length is cut or filled up.
class PacketDecoder final : public SpanDecoder {
public:
    static std::unique_ptr<PacketDecoder> open(std::unique_ptr<PacketSource> source, std::int32_t& status);

    bool packetTable(PacketTable& table) const override;

private:
    PacketDecoder(std::unique_ptr<PacketSource> source, CodecParameters parameters, std::unique_ptr<Codec> codec);
    std::int32_t describeAsDecoded();
    std::int32_t next(Span& span) override;
    std::int32_t startAt(std::uint64_t& number) override;
    std::uint64_t reach(std::uint64_t number) override;
    const AVFrame& decoded() const override { return codec_->frame(); }
    std::int32_t sendPacket();
    std::uint64_t packetOf(std::uint64_t number) const;

    std::unique_ptr<PacketSource> source_;
    CodecParameters parameters_;
    std::unique_ptr<Codec> codec_;
    Packet packet_;
    Bytes bytes_;
    PacketTable table_;
    std::uint64_t framesPerPacket_ = 0;
    std::uint64_t sent_ = 0;    // all earlier packets were sent or skipped
    std::uint64_t awaited_ = 0; // no frame of this packet or a later one came out yet
};

/// As DecoderModule::openPackets.
std::unique_ptr<AudioDecoder> openPackets(std::unique_ptr<PacketSource> source, std::int32_t& status);

} // namespace platform::ffmpeg
