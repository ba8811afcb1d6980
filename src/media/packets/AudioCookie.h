// What a decoder must know ahead of the first packet, and what of the format stands there: the AudioSpecificConfig of
// AAC (ISO/IEC 14496-3, 1.6.2.1), alone or in the ES descriptor that MP4 and CAF put around it (14496-1), and the
// configuration of ALAC.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

/// The functions set sample rate, channels, frames per packet and bits of `format`, and cut `cookie` down to what a
/// decoder is given. kFormatNotSupported, and both undefined, for what this library does not count exactly.

/// AAC-LC of 1,024 or 960 frames and a standard set of channels. Not AAC with spectral band replication, whose decoder
/// gives twice the frames, and nothing of which that may be true: at 24 kHz and below, a configuration must say that
/// there is none.
std::int32_t readAACCookie(Bytes& cookie, StreamDescription& format);
/// The same in the descriptor; kFormatNotSupported also for other codings.
std::int32_t readESDescriptor(Bytes& cookie, StreamDescription& format);
/// kStatusIOError for a configuration that makes no sense.
std::int32_t readALACCookie(Bytes& cookie, StreamDescription& format);

/// What the configuration says beside the format: of AAC and ALAC a number of channels stands for its speakers. Nothing
/// of other codings.
SoundFacts factsOfCookie(const StreamDescription& format);

/// The frames of a packet of ALAC: the last one of a file has fewer than the others, and says so.
std::uint32_t framesOfALACPacket(BytesView packet, std::uint32_t framesPerPacket);

/// The configuration of AAC-LC by the numbers that ADTS has in its headers; says that nothing is replicated.
Bytes makeAACCookie(std::uint32_t rateIndex, std::uint32_t channelConfiguration);

} // namespace platform
