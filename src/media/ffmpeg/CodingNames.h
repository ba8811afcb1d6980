// The system's names of codings and files beside FFmpeg's.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"

#include <string_view>

struct AVCodecParameters;

namespace platform::ffmpeg {

/// FFmpeg's number of a coding whose packets the library finds itself; 0 when there is none.
int codecIdOf(FourCC formatId);

/// How a stream's audio is coded, of samples of `sourceBits` bits (0 where that is not known).
StreamDescription fileFormatOf(const AVCodecParameters& parameters, int sourceBits, double sampleRate,
                               std::uint32_t channels);

/// The frames of one packet of `bytes` bytes, for codings whose blocks are all of one size and say nothing of each
/// other; else 0.
std::uint64_t framesOfBlocks(const AVCodecParameters& parameters, int bytes);

/// Of FFmpeg's numbers of a coding (an AVCodecID) and its profile.
CodingProfile profileOf(int codec, int profile);
/// Whether a coding, an AVCodecID, is one of bits, of which the decoder makes PCM of an eighth of their rate.
bool isDSD(int codec);

/// "flac", "WAVE", …, after the name of a demultiplexer and, in movies, the brand; four characters of the
/// demultiplexer's name for files that have no name elsewhere. `codec` is an AVCodecID.
FourCC fileTypeOf(std::string_view demuxer, std::string_view brand, int codec);

/// The demultiplexers that may be used, apart by commas: files of sound or of pictures with sound, which name no other
/// files.
extern const char* const usedDemuxers;

} // namespace platform::ffmpeg
