// What containers and codings are called by those who use them.
#pragma once

#include "audiofile/AudioFileInfo.h"

#include <string>
#include <vector>

/// "WAVE", "AIFC", "Ogg"; the four characters of the container where it has no other name.
std::string containerWord(const AudioFileInfo& info);
/// "MP3", "HE-AAC", "Vorbis", "IMA ADPCM", with the profile where the file says it; "PCM" for linear samples. What has
/// no name: its four characters, or "format 0x0161", the number that WAVE has for it.
std::string codingWord(const AudioFileInfo& info);
/// "stereo", "5.1", "quad"; of speakers that have no name together their own, "L+R+Tc"; empty when the file does not
/// say.
std::string layoutWord(const AudioFileInfo& info);
/// What each channel is called, in the order of the samples: "L", "LFE" where the file says which speakers they feed
/// and the order is that of WAVE's channel mask; "L" and "R" of two without a word; else "Ch 1".
std::vector<std::string> channelWords(const AudioFileInfo& info);
/// What a sample is: "16-bit", "24 in 32-bit", "32-bit float" of linear PCM; "FLAC 24-bit" of what loses nothing;
/// "DSD 2.8224 MHz" of 1-bit sound; the coding elsewhere.
std::string formatWords(const AudioFileInfo& info);
