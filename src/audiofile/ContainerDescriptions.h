// How an AudioFileInfo is filled from what containers and decoders say.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "audiofile/FileWindow.h"
#include "media/containers/StoredFormat.h"

#include <cstdint>

/// What GetAudioFileInfo does, over a window that stays in use. `url` is where others may open the file; null for one
/// in memory.
std::int32_t DescribeAudioFile(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info);

// Compressed audio outside the containers; `info` has its fileLength.

std::int32_t DescribeFLAC(FileWindow& file, AudioFileInfo& info);
/// A file that begins with `start`; as platform::describeCompressedAudio.
std::int32_t DescribeCompressed(const platform::URL& url, BytesView start, AudioFileInfo& info);

/// The type code by which hosts know a file that the platform's services may name otherwise.
FourCC HostFileType(FourCC type);

/// Sets the sample rate: as it is, and rounded. What is no rate (NaN, infinite, negative, beyond 2^53) gives 0.
void SetSampleRate(AudioFileInfo& info, double rate);
/// Sets what else is known of the sound, behind the frames; what the container has said already stays.
void SetSoundFacts(AudioFileInfo& info, const platform::SoundFacts& facts);
