// What audio files say of themselves that stand in none of the library's containers: MP3, AAC, M4A, and whatever else
// the decoder module reads.
#pragma once

#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"
#include "platform/URL.h"
#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

struct CompressedAudio {
    FourCC fileType = 0;      // "MPG3", "adts", "m4af", "mp4f"; of other files a code of their own
    StreamDescription format; // rate and channels are those of the frames that decoding gives
    std::uint64_t frames = 0;
    SoundFacts facts;
};

/// Where the library finds the packets itself, in MP3, ADTS, MP4 and CAF files, and knows their frames exactly: the
/// decoder module is not asked. AudioHandle::kFormatNotSupported elsewhere; kStatusIOError for a file of these that is
/// broken.
std::int32_t describePackets(const URL& url, CompressedAudio& audio);

/// `start` are the file's first bytes, 16 where it has so many. MP3, AAC of more than 24 kHz and M4A are described
/// without the decoder module, which is loaded for none but files that begin as one of its kinds does.
/// kStatusParameterError for a file that is none of these; AudioHandle::kFormatNotSupported, with `audio.fileType` set,
/// for one that the module does not decode, or would and is not there.
std::int32_t describeCompressedAudio(const URL& url, BytesView start, CompressedAudio& audio);

} // namespace platform
