// Writes waveform data in the formats of the open project audiowaveform, version 2, 8 bits, which its players read.
// Published source: doc/DataFormat.md of that project.
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

/// The format of an output's name: ".dat" and ".json" in any case, "-" for JSON; none for others.
std::optional<AudiowaveformFormat> audiowaveformFormatOf(const std::string& out);

struct AudiowaveformSettings {
    AudiowaveformFormat format = AudiowaveformFormat::json;
    std::int64_t from = 0, to = 0; // frames, within the sound
    std::int32_t framesPerPoint = 256;
    std::vector<SoundLane> lanes; // one per channel; of kind channel or sum
};

/// Reads the sound and writes its points to `sink`: for each of them a lowest and a highest sample per lane, -128 to
/// 127. The progress function receives the number of frames since its last call. Throws Failure.
void writeAudiowaveform(SoundReader& sound, const AudiowaveformSettings& settings, const Sink& sink,
                        const std::function<void(std::int64_t frames)>& progress);
