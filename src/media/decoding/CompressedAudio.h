// What audio files say of themselves that stand in none of the library's containers: MP3, AAC, M4A, and whatever else
// the decoder module reads.
#pragma once

#include "media/packets/FileEnds.h"
#include "platform/URL.h"
#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

/// Where the library finds the packets itself, in MP3, ADTS, MP4 and CAF files, and knows their frames exactly: the
/// decoder module is not asked. AudioHandle::kFormatNotSupported elsewhere; kStatusIOError for a file of these that is
/// broken.
std::int32_t describePackets(const URL& url, CompressedAudio& audio);

/// What decoding gives, by the decoder module, of a file that begins as one of `fileType`, which becomes what the
/// module says. AudioHandle::kFormatNotSupported for one that the module does not decode, or would and is not there.
std::int32_t describeByDecoding(const URL& url, FourCC fileType, CompressedAudio& audio);

/// `start` are the file's first bytes, 16 where it has so many. MP3, AAC of more than 24 kHz and M4A are described
/// without the decoder module, and so are files whose ends prove how long they are (FileEnds.h); it is loaded for none
/// but files that begin as one of its kinds does.
/// kStatusParameterError for a file that is none of these; AudioHandle::kFormatNotSupported, with `audio.fileType` set,
/// for one that the module does not decode, or would and is not there.
std::int32_t describeCompressedAudio(const URL& url, BytesView start, CompressedAudio& audio);

} // namespace platform
