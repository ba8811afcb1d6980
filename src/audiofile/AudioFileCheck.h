// What is off in an open audio file.
#pragma once

#include "media/containers/ContainerCheck.h"

#include <functional>

class CAudioFileIO;
class CFileIO;

/// As platform::checkContainer, which says what is found and returned; kStatusParameterError also for a file that is
/// compressed throughout, of which AudioFileInfo::IsWhole() tells.
KT_EXPORT std::int32_t CheckAudioFile(CFileIO& file, std::vector<platform::ContainerFinding>& findings);

/// Compares the sample bytes of an open WAVE file with the MD5 that its chunk "MD5 " states of them, as programs for
/// broadcast wave files embed it: 16 bytes, the digest as a number of 128 bits, little-endian; in the order in which
/// the digest is written, too, which other programs take. Reads all samples where there is such a chunk and nothing of
/// them is missing, and none otherwise. `goesOn` as in DigestAudio. 0; the status of a read that failed.
KT_EXPORT std::int32_t CheckStatedDigest(CAudioFileIO& file, std::vector<platform::ContainerFinding>& findings,
                                         const std::function<bool()>& goesOn = {});
