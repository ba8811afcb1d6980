// The limits that every writer and reader of audio files checks ahead of its work. Nothing here opens a file.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "platform/core/Export.h"

#include <cstdint>

/// How many bytes a file of the type may have; the flag lifts the limit of "WAVE".
KT_EXPORT std::int64_t MaxAudioFileSize(unsigned int fileType, bool flag);
/// How many frames fit into a file of the type; 0 for an unknown bus format and for fewer than 8 bits.
KT_EXPORT std::uint64_t MaxNumberOfFramesInAudioFile(int fileType, int bitsPerSample, int busFormat);
/// Whether sample bytes must be swapped on a little-endian host.
KT_EXPORT bool AudioFileDataNeedsSwap(unsigned int fileType, int bitsPerSample, unsigned int formatCode);
/// The beats of a loop whose file does not state them: a guess that puts the tempo between 70 and 140.5 beats per
/// minute. 0 when the file states them, and for files too short or longer than a minute. The third argument is
/// ignored.
KT_EXPORT float CalculateBeatCountForFile(const AudioFileInfo* info, int count, int);
