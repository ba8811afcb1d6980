// The sound of any audio file as a WAVE file that browsers play, of which any part can be read.
#pragma once

#include "media/decoding/ConvertingReader.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

/// What the sound becomes, if it is more than that.
struct WaveLimits {
    double sampleRate = 48'000;
    std::uint32_t channels = 2;
    double seconds = 1e9;
};

/// 16-bit samples. Owns the reader. Operations throw Failure.
class WaveStream {
public:
    WaveStream(const std::string& path, const WaveLimits& limits);

    /// In bytes, with the header.
    std::int64_t size() const { return kHeaderSize + frames_ * frameSize(); }
    double seconds() const { return static_cast<double>(frames_) / sampleRate_; }
    /// The bytes from `offset` on, at most as many as wanted, at least one ahead of the end. Silence stands for what
    /// cannot be decoded.
    std::string read(std::int64_t offset, std::size_t wanted);

private:
    static constexpr std::int64_t kHeaderSize = 44;

    void setFormat(const WaveLimits& limits);
    bool tryFormat(double sampleRate);
    std::string header() const;
    std::int64_t frameSize() const { return std::int64_t{channels_} * 2; }
    void readFrames(std::int64_t from, std::string& bytes);

    std::unique_ptr<platform::ConvertingReader> reader_;
    double sampleRate_ = 0;
    std::uint32_t channels_ = 0;
    std::int64_t frames_ = 0;
    std::int64_t position_ = 0; // of the reader; -1 if it is not known
};
