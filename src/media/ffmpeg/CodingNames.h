// Maps FFmpeg's codings and files to the system's names.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"

#include <string_view>

struct AVCodecParameters;

namespace platform::ffmpeg {

/// FFmpeg's id of a coding whose packets the library finds itself; 0 if there is none.
int codecIdOf(FourCC formatId);

/// How a stream's audio is coded, from samples of `sourceBits` bits (0 if unknown).
StreamDescription fileFormatOf(const AVCodecParameters& parameters, int sourceBits, double sampleRate,
                               std::uint32_t channels);

/// Frames per packet of `bytes` bytes, for codings with independent blocks of one size; else 0.
std::uint64_t framesOfBlocks(const AVCodecParameters& parameters, int bytes);

/// Takes FFmpeg's AVCodecID and profile.
CodingProfile profileOf(int codec, int profile);
/// Whether the coding, an AVCodecID, is 1-bit sound, from which the decoder makes PCM at an eighth of the rate.
bool isDSD(int codec);

/// "flac", "WAVE", …, from the demultiplexer's name and, in movies, the brand; four characters of the demultiplexer's
/// name for files without a name elsewhere. `codec` is an AVCodecID.
FourCC fileTypeOf(std::string_view demuxer, std::string_view brand, int codec);

/// The allowed demultiplexers, separated by commas: files of sound, or of pictures with sound, that refer to no other
/// files.
extern const char* const usedDemuxers;

} // namespace platform::ffmpeg
