// The samples of one audio file, of any format, in pieces.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

/// Owns the open file. Operations throw Failure.
class SoundReader {
public:
    /// Opens it, and makes sure that there is sound in it that can be read.
    explicit SoundReader(const std::string& path);

    CAudioFileIO& file() { return file_; }
    const AudioFileInfo& info() const { return file_.Info(); }
    /// What people should know of a file that ends ahead of its samples; else empty.
    std::string note() const;

    /// Takes interleaved frames, full scale being 1, and how many they are.
    using Visit = std::function<void(const float* samples, std::int64_t frames)>;
    /// The frames from `from` up to `to`, which lies within the sound.
    void read(std::int64_t from, std::int64_t to, const Visit& visit);

private:
    CAudioFileIO file_;
    std::vector<float> piece_;
};

/// The rate of what has a place in time. Throws Failure for a file that claims one beyond reason.
double sampleRateOf(const AudioFileInfo& info);
