// Reads the samples of one audio file of any format, piece by piece.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

/// Owns the open file. Operations throw Failure.
class SoundReader {
public:
    /// Opens the file and requires readable sound.
    explicit SoundReader(const std::string& path);

    CAudioFileIO& file() { return file_; }
    const AudioFileInfo& info() const { return file_.Info(); }
    /// A note if the file ends before its samples do; else empty.
    std::string note() const;

    /// Receives interleaved frames with full scale 1, and their number.
    using Visit = std::function<void(const float* samples, std::int64_t frames)>;
    /// Reads the frames from `from` up to `to`, which lies within the sound.
    void read(std::int64_t from, std::int64_t to, const Visit& visit);

private:
    CAudioFileIO file_;
    std::vector<float> piece_;
};

/// The sample rate, needed to place frames in time. Throws Failure if the file claims an absurd one.
double sampleRateOf(const AudioFileInfo& info);
