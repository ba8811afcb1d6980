#include "media/packets/OggCoding.h"

#include "media/packets/FLACInfo.h"
#include "media/packets/HighFirstCRC.h"
#include "media/packets/VorbisCoding.h"
#include "platform/core/Packed.h"

#include <algorithm>

namespace platform {

namespace {

bool begins(BytesView packet, std::string_view text)
{
    return packet.size() >= text.size() && textOf(packet.first(text.size())) == text;
}

/// RFC 7845, and RFC 6716, 3.1, for packets.
class OpusCoding final : public OggCoding {
public:
    static std::unique_ptr<OggCoding> of(BytesView first)
    {
        // "OpusHead", version 1, channels 1, frames to skip 2, source's rate 4, gain 2, mapping family 1
        constexpr std::size_t size = 19;
        if (!begins(first, "OpusHead") || first.size() < size || (first[8] & std::byte{0xF0}) != std::byte{0})
            return nullptr;
        const auto channels = std::to_integer<std::uint32_t>(first[9]);
        const auto family = std::to_integer<unsigned>(first[18]);
        const bool hasTable = first.size() == size + 2 + channels; // streams, coupled ones, mapping
        const bool isKnown = family == 0 ? channels <= 2 && first.size() == size : family == 1 && hasTable;
        if (!isKnown || speakersOfVorbis(channels) == 0)
            return nullptr;
        auto coding = std::make_unique<OpusCoding>();
        coding->format_.formatId = fourCC("opus");
        coding->format_.sampleRate = 48000;
        coding->format_.channelsPerFrame = channels;
        coding->speakers_ = speakersOfVorbis(channels);
        coding->priming_ = loadLE<std::uint16_t>(first.data() + 10);
        return coding;
    }
    bool hasHeaders() const override { return hasHeaders_; }
    bool takeHeader(BytesView packet) override { return hasHeaders_ = begins(packet, "OpusTags"); }
    std::optional<std::uint32_t> framesOf(BytesView packet) override
    {
        constexpr std::uint32_t most = 5760; // 120 ms
        if (packet.size() < 2)
            return {};
        const auto first = std::to_integer<std::uint32_t>(packet[0]);
        const std::uint32_t kind = first >> 3, count = first & 3;
        const std::uint32_t size = kind < 12   ? std::max(480U, 960 * (kind & 3))
                                   : kind < 16 ? 480U << (kind & 1)
                                               : 120U << (kind & 3);
        const std::uint32_t blocks =
            count == 3 ? std::to_integer<std::uint32_t>(packet[1]) & 63 : std::min(count + 1, 2U);
        return blocks > 0 && size * blocks <= most ? std::optional(size * blocks) : std::nullopt;
    }

private:
    bool hasHeaders_ = false;
};

/// RFC 9639, 10.1. Each packet is a metadata block or a frame.
class FLACCoding final : public OggCoding {
public:
    static std::unique_ptr<OggCoding> of(BytesView first)
    {
        // 0x7F, "FLAC", version 2, number of headers 2, "fLaC", a block's header 4, and the block with its checksum
        constexpr std::size_t size = 51, blockAt = 13;
        constexpr std::uint32_t streamInfo = 34; // type 0, of that many bytes
        constexpr std::uint32_t mostBits = 24;
        if (first.size() != size ||
            !begins(first, {"\x7F"
                            "FLAC\x01",
                            6}) ||
            textOf(first.subspan(9, 4)) != "fLaC" ||
            (loadBE<std::uint32_t>(first.data() + blockAt) & 0x7FFFFFFF) != streamInfo)
            return nullptr;
        auto coding = std::make_unique<FLACCoding>();
        const FLACProperties properties = readFLACProperties(first.subspan(blockAt + 4));
        coding->format_ = properties.format;
        coding->blockSize_ = properties.mostInBlock;
        coding->hasHeaders_ = isLastBlock(first[blockAt]);
        coding->speakers_ = usualSpeakersOfFLAC(properties.format.channelsPerFrame);
        const bool isUsual = properties.format.sampleRate > 0 && properties.format.bitsPerChannel <= mostBits;
        return isUsual ? std::move(coding) : nullptr;
    }
    bool hasHeaders() const override { return hasHeaders_; }
    bool takeHeader(BytesView packet) override
    {
        if (packet.empty() || packet[0] == std::byte{0xFF})
            return false;
        hasHeaders_ = isLastBlock(packet[0]);
        return true;
    }
    std::optional<std::uint32_t> framesOf(BytesView packet) override
    {
        first_.reset();
        if (packet.empty()) // some encoders end the stream with it
            return 0;
        // Decoders reject a frame whose own checksum is wrong, and a frame's fields override the header.
        const auto frame = parseFLACFrame(packet, blockSize_);
        const bool isOfStream = frame && (frame->sampleRate == 0 || frame->sampleRate == format_.sampleRate) &&
                                frame->channels == format_.channelsPerFrame &&
                                (frame->bits == 0 || frame->bits == format_.bitsPerChannel) &&
                                highFirstCRC<16, 0x8005>(packet) == 0;
        if (!isOfStream)
            return {};
        first_ = frame->first;
        return frame->samples;
    }
    bool endsInsidePacket() const override { return false; }
    std::optional<std::uint64_t> firstFrame() const override { return first_; }

private:
    static bool isLastBlock(std::byte type) { return (type & std::byte{0x80}) != std::byte{0}; }

    std::uint32_t blockSize_ = 0;
    bool hasHeaders_ = false;
    std::optional<std::uint64_t> first_;
};

} // namespace

std::unique_ptr<OggCoding> OggCoding::of(BytesView first)
{
    for (const auto make : {VorbisCoding::of, OpusCoding::of, FLACCoding::of})
        if (std::unique_ptr<OggCoding> coding = make(first))
            return coding;
    return nullptr;
}

} // namespace platform
