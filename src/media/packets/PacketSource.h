// The packets of a compressed audio file, found by the library itself: MP3, ADTS, M4A (and MP4, MOV) and CAF. What a
// file says of its frames is so known, exactly, without a decoder; a module's decoder takes the packets from here.
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

/// Owns the file. Every packet decodes to format().framesPerPacket frames; of ALAC the last one only to those that are
/// valid. The frames of packet p are the numbers from
/// p x framesPerPacket on; the sound begins at number table().primingFrames. A module's decoder calls these, so that
/// everything here is inline or pure. Operations return 0 or a negative status.
class PacketSource {
public:
    PacketSource() = default;
    virtual ~PacketSource() = default;
    PacketSource(const PacketSource&) = delete;
    PacketSource& operator=(const PacketSource&) = delete;

    /// How the file holds its audio: ".mp3", "aac ", "alac", …, at the rate and the channels that decoding gives.
    /// bitsPerChannel is that of the source for lossless codings, else 0.
    virtual const StreamDescription& format() const = 0;
    /// "MPG3", "adts", "m4af", "mp4f" or "caff".
    virtual FourCC fileType() const = 0;
    /// What a decoder must know ahead of the first packet: for AAC the AudioSpecificConfig (ISO/IEC 14496-3), for ALAC
    /// the ALACSpecificConfig of 24 or more bytes. ADTS, whose frames carry it, has one made of the first frame's.
    /// Empty for others.
    virtual BytesView cookie() const = 0;
    virtual const PacketTable& table() const = 0;
    virtual std::uint64_t packetCount() const = 0;
    /// What the headers say; which speakers there are as the usual decoders have them.
    virtual SoundFacts facts() const = 0;
    /// Packets to decode and drop ahead of one, so that it decodes as in a run from the first; never more than
    /// `packet`.
    virtual std::uint64_t preRoll(std::uint64_t packet) = 0;
    /// Puts the bytes of a packet, without the header of its transport, into `bytes`. Memory grows to the largest
    /// packet met, never by what a file claims. kStatusEndOfFile beyond the last, which an MP3 that is damaged inside
    /// may have ahead of the number that its header counts.
    virtual std::int32_t read(std::uint64_t packet, Bytes& bytes) = 0;
};

/// Null with `*status`: kFormatNotSupported when the file is none of these, or holds what only a general demultiplexer
/// can find its way in; kStatusIOError when it is one and broken.
std::unique_ptr<PacketSource> openPacketSource(const std::string& path, std::int32_t* status);

} // namespace platform
