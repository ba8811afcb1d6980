// The configuration that a decoder needs before the first packet, and the facts in it: the AudioSpecificConfig of AAC
// (ISO/IEC 14496-3, 1.6.2.1), alone or in the ES descriptor of MP4 and CAF (14496-1), and the configuration of ALAC.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

/// These set sample rate, channels, frames per packet and bits of `format`, and cut `cookie` to what a decoder
/// receives. kFormatNotSupported, with both undefined, for formats whose frames this library cannot count exactly.

/// AAC-LC of 1,024 or 960 frames with a standard set of channels. AAC with spectral band replication, whose decoder
/// doubles the frames, is not supported, nor is any configuration that leaves it open: at 24 kHz and below it must be
/// ruled out.
std::int32_t readAACCookie(Bytes& cookie, StreamDescription& format);
/// As above, from the descriptor; kFormatNotSupported for other codings too.
std::int32_t readESDescriptor(Bytes& cookie, StreamDescription& format);
/// kStatusIOError if the configuration makes no sense.
std::int32_t readALACCookie(Bytes& cookie, StreamDescription& format);

/// Facts beside the format: for AAC and ALAC the number of channels determines the speakers. Empty for other codings.
SoundFacts factsOfCookie(const StreamDescription& format);

/// The frames in a packet of ALAC. The last packet of a file has fewer than the others, and says so.
std::uint32_t framesOfALACPacket(BytesView packet, std::uint32_t framesPerPacket);

/// A configuration of AAC-LC from the numbers in ADTS headers; rules out replication.
Bytes makeAACCookie(std::uint32_t rateIndex, std::uint32_t channelConfiguration);

} // namespace platform
