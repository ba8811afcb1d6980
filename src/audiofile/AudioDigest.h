// Digests of a file's sound as it is stored: the bytes of its samples alone, whatever stands beside them.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "platform/Digest.h"

#include <functional>
#include <span>

/// Adds the sample bytes of an open file, [info.dataOffset, info.dataOffset + info.dataSize), to each of the digests,
/// in one pass: for MD5 of a WAVE file what archives keep of its chunk "data". `goesOn`, asked ahead of each MiB, ends
/// the work with kStatusUserCancelled when it says no. kStatusParameterError for a file whose samples are not known to
/// stand in one piece (dataSize 0); kStatusEndOfFile for one that became shorter; the status of a read that failed.
KT_EXPORT std::int32_t DigestAudio(CFileIO& file, const AudioFileInfo& info, std::span<platform::Digest* const> digests,
                                   const std::function<bool()>& goesOn = {});

/// The MD5 that a FLAC file states of its sound as it was ahead of the encoder (RFC 9639, section 8.2), 16 bytes; empty
/// when the file states none or is no FLAC file.
KT_EXPORT Bytes StatedMD5(CFileIO& file);
