// An audio file of any format, read as the sound that `ktfiles decode` was asked for.
#pragma once

#include "media/decoding/ConvertingReader.h"
#include "tool/decode/DecodeFormat.h"
#include "tool/shared/output/ClockTime.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// The requested properties; others stay as in the file.
struct DecodeWishes {
    const DecodeFormat* format = nullptr;
    std::optional<double> sampleRate;
    std::optional<std::uint32_t> channels;
    std::optional<SampleDepth> depth;
    // In output terms; at most one of `end` and `frames`.
    SoundLength start;
    std::optional<SoundLength> end, frames;
};

/// Owns the reader. Operations throw Failure.
class DecodeSource {
public:
    DecodeSource(const std::string& path, const DecodeWishes& wishes);

    /// The output's sound. It has that many frames unless the file ends before the length that it promises.
    const DecodedSound& sound() const { return sound_; }
    bool isWhole() const { return isWhole_; }
    /// Position in FILE, at the output's rate, of the output's first frame.
    std::uint64_t start() const { return start_; }
    /// Frames per second of the source.
    double sourceRate() const { return sourceRate_; }
    /// Deviations from the request, in words.
    const std::vector<std::string>& notes() const { return notes_; }

    /// The next samples in the output's format; empty at the end.
    std::string_view read();
    /// Samples so far that exceeded full scale and were clipped.
    std::int64_t clippedSamples() const { return clipped_; }

    /// Frames of FILE read so far that could not be decoded and are silence.
    std::uint64_t missingFrames() const { return reader_->missingFrames(); }
    /// Whether everything was read and contradicts FILE's checksum.
    bool isOtherThanItsChecksum() const { return reader_->checksum() == platform::ConvertingReader::Checksum::differs; }

private:
    void open(const std::string& path);
    void lookInto(const std::string& path);
    void setFormats(const DecodeWishes& wishes);
    void setRange(const DecodeWishes& wishes);
    std::uint32_t readFrames(void* to, std::uint32_t frames);
    void clip(std::size_t samples);

    std::unique_ptr<platform::ConvertingReader> reader_;
    DecodedSound sound_;
    platform::StreamDescription stream_; // of the output
    double sourceRate_ = 0;
    bool isWhole_ = true;
    std::vector<std::string> notes_;
    std::uint64_t start_ = 0;
    std::int64_t left_ = 0; // frames
    std::uint32_t blockFrames_ = 0;
    std::vector<std::byte> block_;
    std::vector<float> floats_; // of a block that may have to be clipped; else empty
    std::int64_t clipped_ = 0;
};
