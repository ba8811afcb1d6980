// Frames as decoders give them, and as they are handed out: interleaved and packed, in the processor's byte order.
#pragma once

#include "media/samples/StreamDescription.h"

#include <cstddef>
#include <cstdint>
#include <optional>

struct AVFrame;

namespace platform::ffmpeg {

/// Interleaved, packed linear PCM in the processor's byte order; integers are signed.
StreamDescription nativePCM(double sampleRate, std::uint32_t channels, SampleFormat sample);

/// What frames of a decoder are handed out in: floats where it gives floats, else integers of 16, 24 or 32 bits, as
/// many as the source has, `sourceBits` if that is known. Nothing when the decoder's samples are of no such kind.
std::optional<StreamDescription> frameFormatOf(int sourceBits, const AVFrame& frame);

/// As SoundFacts::speakers.
std::uint32_t speakersOf(const AVFrame& frame);

/// Puts `count` frames from `first` on into `to`, in a format of frameFormatOf(). Where the frame has another number of
/// channels, one goes to all; otherwise surplus ones are left out and missing ones silent. Samples of a kind that does
/// not become the format's are silence.
void interleave(const AVFrame& frame, std::uint64_t first, std::size_t count, const StreamDescription& format,
                std::byte* to);

} // namespace platform::ffmpeg
