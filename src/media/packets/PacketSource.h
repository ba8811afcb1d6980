// The packets of a compressed audio file, found by the library itself: MP3, ADTS, M4A (and MP4, MOV) and CAF. So frames
// are counted exactly without a decoder; a module's decoder gets its packets here.
#pragma once

#include "media/containers/AudioHandle.h"
#include "media/packets/PacketTable.h"
#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

namespace platform {

/// Owns the file. Every packet decodes to format().framesPerPacket frames, except that the last of ALAC has only the
/// valid ones. Packet p has the frames from p x framesPerPacket on; the sound begins at table().primingFrames. A
/// module's decoder calls these, so everything here is inline or pure. Operations return 0 or a negative status.
class PacketSource {
public:
    PacketSource() = default;
    virtual ~PacketSource() = default;
    PacketSource(const PacketSource&) = delete;
    PacketSource& operator=(const PacketSource&) = delete;

    /// How the file stores its audio: ".mp3", "aac ", "alac", …, at the rate and channels that decoding yields.
    /// bitsPerChannel is the source's for lossless codings, else 0.
    virtual const StreamDescription& format() const = 0;
    /// "MPG3", "adts", "m4af", "mp4f" or "caff".
    virtual FourCC fileType() const = 0;
    /// The configuration that a decoder needs before the first packet: for AAC the AudioSpecificConfig (ISO/IEC
    /// 14496-3), for ALAC the ALACSpecificConfig of 24 or more bytes. For ADTS, whose frames carry it, it is made from
    /// the first frame. Empty for others.
    virtual BytesView cookie() const = 0;
    virtual const PacketTable& table() const = 0;
    virtual std::uint64_t packetCount() const = 0;
    /// What the headers say; speakers as the usual decoders assign them.
    virtual SoundFacts facts() const = 0;
    /// How many packets to decode and drop before one, so that it decodes as in a run from the first; at most `packet`.
    virtual std::uint64_t preRoll(std::uint64_t packet) = 0;
    /// Reads a packet, without its transport header, into `bytes`. Memory grows to the largest packet met, never by
    /// what a file claims. kStatusEndOfFile after the last packet, which in a damaged MP3 may come before the number
    /// that its header counts.
    virtual std::int32_t read(std::uint64_t packet, Bytes& bytes) = 0;
};

/// Null with `*status`: kFormatNotSupported if the file is none of these, or only a general demultiplexer can read it;
/// kStatusIOError if it is one and broken.
std::unique_ptr<PacketSource> openPacketSource(const std::string& path, std::int32_t* status);

} // namespace platform
