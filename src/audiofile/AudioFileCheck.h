// What is wrong with an open audio file.
#pragma once

#include "media/containers/ContainerCheck.h"

#include <functional>

class CAudioFileIO;
class CFileIO;

/// As platform::checkContainer, with its findings and results. kStatusParameterError also for a file that is
/// compressed throughout; AudioFileInfo::IsWhole() judges those.
KT_EXPORT std::int32_t CheckAudioFile(CFileIO& file, std::vector<platform::ContainerFinding>& findings);

/// Compares the sample bytes of an open WAVE file with the MD5 in its chunk "MD5 ", which programs for broadcast wave
/// files embed: 16 bytes, the digest as a little-endian 128-bit number, or in the order in which a digest is written,
/// as other programs have it. Reads all samples when there is such a chunk and none of them is missing, and nothing
/// otherwise. `goesOn` as in DigestAudio. 0, or the status of a failed read.
KT_EXPORT std::int32_t CheckStatedDigest(CAudioFileIO& file, std::vector<platform::ContainerFinding>& findings,
                                         const std::function<bool()>& goesOn = {});
