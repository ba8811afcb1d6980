// Digests of a file's sound as it is stored: the bytes of its samples and nothing else.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "platform/Digest.h"

#include <functional>
#include <span>

/// Adds the sample bytes of an open file, [info.dataOffset, info.dataOffset + info.dataSize), to each digest, in one
/// pass; of a WAVE file that is the chunk "data", whose MD5 archives keep. `goesOn` is asked ahead of each MiB; its
/// no ends the work with kStatusUserCancelled. kStatusParameterError when the samples are not known to lie in one
/// piece (dataSize 0), kStatusEndOfFile for a file that became shorter, else the status of a failed read.
KT_EXPORT std::int32_t DigestAudio(CFileIO& file, const AudioFileInfo& info, std::span<platform::Digest* const> digests,
                                   const std::function<bool()>& goesOn = {});

/// The MD5 of the unencoded sound that a FLAC file states (RFC 9639, section 8.2), 16 bytes; empty when it states
/// none and for other files.
KT_EXPORT Bytes StatedMD5(CFileIO& file);
