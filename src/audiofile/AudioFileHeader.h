// Headers of new audio files.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstddef>
#include <cstdint>

/// The size of a buffer for BuildAudioFileHeader, in bytes.
inline constexpr std::size_t kMaxAudioFileHeaderSize = 4096;

/// Writes the complete header of a file whose samples follow it, and returns its length in bytes. 0, and nothing
/// written, for an unknown type, a format that the type cannot hold, and more frames than its size fields can state.
/// `fileType` is "WAVE" (little-endian; 8 bits unsigned), "AIFF" (big-endian; floats as AIFC), or "caff"
/// (little-endian). `bits` is 8, 16, 24, 32 or 64, -32 for 32-bit floats; 64 means floats. `channels` of 0 means as
/// many as `busFormat` has; for more than two channels, WAVE and CAF files name the bus format's speakers. WAVE is
/// extensible for more than 16 bits or two channels. `option` reserves room ("JUNK") for a WAVE file to grow past 4
/// GiB, and makes it RF64 once it has.
KT_EXPORT long BuildAudioFileHeader(void* buffer, FourCC fileType, long long frames, long long sampleRate, int channels,
                                    int bits, TAudioBusFormat busFormat, bool option);

/// The same header, of any length, with further chunks ahead of the samples: whole ones, with headers and pad bytes.
/// Empty where BuildAudioFileHeader returns 0.
KT_EXPORT Bytes MakeAudioFileHeader(FourCC fileType, long long frames, long long sampleRate, int channels, int bits,
                                    TAudioBusFormat busFormat, bool option, Bytes chunks);
