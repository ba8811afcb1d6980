// How an AudioFileInfo is filled from what containers and decoders say.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "audiofile/FileWindow.h"
#include "media/containers/StoredFormat.h"

#include <cstdint>

/// Does what GetAudioFileInfo does, over a window that stays in use. `url` is where decoders may open the file; null
/// for a file in memory.
std::int32_t DescribeAudioFile(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info);

// Compressed audio outside the containers; `info` has its fileLength.

/// Describes a FLAC file by its header; 0 or a status.
std::int32_t DescribeFLAC(FileWindow& file, AudioFileInfo& info);
/// Describes a file that begins with `start`, as platform::describeCompressedAudio does.
std::int32_t DescribeCompressed(const platform::URL& url, BytesView start, AudioFileInfo& info);

/// The type code that hosts know, for a code of the platform's services.
FourCC HostFileType(FourCC type);

/// Sets both sample rates, one of them rounded; 0 for what is no rate (NaN, infinite, negative, beyond 2^53).
void SetSampleRate(AudioFileInfo& info, double rate);
/// Adds facts about the sound; facts that the container has given stay.
void SetSoundFacts(AudioFileInfo& info, const platform::SoundFacts& facts);
