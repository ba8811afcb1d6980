// Converts decoders' frames to what is handed out: interleaved and packed, in the processor's byte order.
#pragma once

#include "media/samples/StreamDescription.h"

#include <cstddef>
#include <cstdint>
#include <optional>

struct AVFrame;

namespace platform::ffmpeg {

/// Interleaved, packed linear PCM in the processor's byte order; integers are signed.
StreamDescription nativePCM(double sampleRate, std::uint32_t channels, SampleFormat sample);

/// The format for a decoder's frames: floats stay floats; integers get 16, 24 or 32 bits, as many as the source has
/// (`sourceBits`, if known). None if the samples are not supported.
std::optional<StreamDescription> frameFormatOf(int sourceBits, const AVFrame& frame);

/// As SoundFacts::speakers.
std::uint32_t speakersOf(const AVFrame& frame);

/// Copies `count` frames from `first` on to `to`, in a format of frameFormatOf(). If the frame has another number of
/// channels, a single one goes to all; otherwise extra channels are dropped and missing ones are silent. Samples that
/// cannot be converted to the format are silence.
void interleave(const AVFrame& frame, std::uint64_t first, std::size_t count, const StreamDescription& format,
                std::byte* to);

} // namespace platform::ffmpeg
