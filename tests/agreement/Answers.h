// What each interface of the library reports about one file.
#pragma once

#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>

/// How one interface describes a file, or the status with which it refuses.
struct Answer {
    std::int32_t status = 0;
    FourCC type = 0;
    double rate = 0;
    std::int64_t channels = 0;
    std::int64_t frames = 0;
    std::uint32_t speakers = 0; // for description and stream
    bool isCompressed = false;  // for the description: the coding may be one that cannot be decoded

    /// "WAVE 44100 Hz 2 ch 1000 frames", or the status.
    std::string text() const;
    bool isSame(const Answer& other) const;
};

/// The description as in `ktfiles info`: GetAudioFileInfo, plus the decoder if only a header states the frames.
Answer describedFile(const std::string& path);
/// A stream, and the number of frames that it delivers.
Answer streamedFile(const std::string& path);
/// A waveform overview of all frames.
Answer overviewOfFile(const std::string& path);

/// Why the three disagree; empty if they agree. They agree if they report the same, or if both stream and overview are
/// refused and the description claims no linear PCM.
std::string disagreement(const std::string& path);
