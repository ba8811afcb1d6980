// Common names of containers and codings.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <string>
#include <vector>

/// "WAVE", "AIFC", "Ogg"; the container's four characters if it has no other name.
std::string containerWord(const AudioFileInfo& info);
/// "MP3", "HE-AAC", "Vorbis", "IMA ADPCM", with the profile if the file states it; "PCM" for linear samples. A coding
/// without a name: its four characters, or "format 0x0161" with its number in WAVE.
std::string codingWord(const AudioFileInfo& info);
/// "stereo", "5.1", "quad"; for a set of speakers without a name, theirs: "L+R+Tc"; empty if the file does not say.
std::string layoutWord(const AudioFileInfo& info);
/// Names of the channels in the order of the samples: "L", "LFE" if the file states the speakers and has the order of
/// WAVE's channel mask; "L" and "R" for two unnamed channels; else "Ch 1".
std::vector<std::string> channelWords(const AudioFileInfo& info);
/// The kind of sample: "16-bit", "24 in 32-bit", "32-bit float" for linear PCM; "FLAC 24-bit" for lossless codings;
/// "DSD 2.8224 MHz" for 1-bit sound; else the coding.
std::string formatWords(const AudioFileInfo& info);
