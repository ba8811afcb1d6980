// Waveform data in the formats of the open project audiowaveform, version 2, 8 bits, which its players read. Published
// source: doc/DataFormat.md of that project.
#pragma once

#include "tool/overview/SoundLanes.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/input/SoundReader.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

enum class AudiowaveformFormat { json, dat };

/// The format that the name of an output means: ".dat" and ".json" in any case, "-" is JSON; none for another one.
std::optional<AudiowaveformFormat> audiowaveformFormatOf(const std::string& out);

struct AudiowaveformSettings {
    AudiowaveformFormat format = AudiowaveformFormat::json;
    std::int64_t from = 0, to = 0; // frames, within the sound
    std::int32_t framesPerPoint = 256;
    std::vector<SoundLane> lanes; // a channel for each; of kind channel or sum
};

/// Reads the sound and writes its points to `sink`, a lowest and a highest sample for each lane of each, -128 to 127.
/// Told how many frames are done since the last call. Throws Failure.
void writeAudiowaveform(SoundReader& sound, const AudiowaveformSettings& settings, const Sink& sink,
                        const std::function<void(std::int64_t frames)>& progress);
