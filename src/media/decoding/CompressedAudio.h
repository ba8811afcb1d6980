// Descriptions of audio files outside the library's containers: MP3, AAC, M4A, and whatever else the decoder module
// reads.
#pragma once

#include "media/packets/FileEnds.h"
#include "platform/URL.h"
#include "platform/core/Bytes.h"

#include <cstdint>

namespace platform {

/// Describes MP3, ADTS, MP4 and CAF files, whose packets the library finds and counts exactly without the decoder
/// module. AudioHandle::kFormatNotSupported for other files; kStatusIOError for a broken one of these.
std::int32_t describePackets(const URL& url, CompressedAudio& audio);

/// Describes what the decoder module gives for a file that begins as one of `fileType`, which becomes what the module
/// says. AudioHandle::kFormatNotSupported when the module does not decode it or is not installed.
std::int32_t describeByDecoding(const URL& url, FourCC fileType, CompressedAudio& audio);

/// Describes a file by its first bytes `start`, 16 where it has so many. MP3, AAC of more than 24 kHz, M4A, and files
/// whose ends prove how long they are (FileEnds.h) need no decoder module; it is loaded only for files that begin as
/// one of its kinds. kStatusParameterError for a file that is none of these; AudioHandle::kFormatNotSupported, with
/// `audio.fileType` set, when the module does not decode it or is not installed.
std::int32_t describeCompressedAudio(const URL& url, BytesView start, CompressedAudio& audio);

} // namespace platform
