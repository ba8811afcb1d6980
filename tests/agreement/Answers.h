// What the library says of one file, by each of its roads.
#pragma once

#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>

/// What a road says that a file is, or with which status it refuses.
struct Answer {
    std::int32_t status = 0;
    FourCC type = 0;
    double rate = 0;
    std::int64_t channels = 0;
    std::int64_t frames = 0;
    std::uint32_t speakers = 0; // of description and stream
    bool isCompressed = false;  // by the description: then the coding may be one that nothing decodes

    /// "WAVE 44100 Hz 2 ch 1000 frames", or the status.
    std::string text() const;
    bool isSame(const Answer& other) const;
};

/// The description, as `ktfiles info` takes it: GetAudioFileInfo, and the decoder where a header alone states the
/// frames.
Answer describedFile(const std::string& path);
/// A stream, and how many frames can be read from it.
Answer streamedFile(const std::string& path);
/// A waveform overview of all frames.
Answer overviewOfFile(const std::string& path);

/// Why the three do not agree; empty when they do. They agree when they tell the same, and where a stream is refused,
/// with a status, when the overview is too and the description has no linear PCM to offer.
std::string disagreement(const std::string& path);
