// An audio file of any format as the sound that `ktfiles decode` was asked for.
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

/// What is asked for; what is not stays as the file has it.
struct DecodeWishes {
    const DecodeFormat* format = nullptr;
    std::optional<double> sampleRate;
    std::optional<std::uint32_t> channels;
    std::optional<SampleDepth> depth;
    // Of the output; of `end` and `frames` one at most.
    SoundLength start;
    std::optional<SoundLength> end, frames;
};

/// Owns the reader. Operations throw Failure.
class DecodeSource {
public:
    DecodeSource(const std::string& path, const DecodeWishes& wishes);

    /// Of the output, which has as many frames unless the file ends ahead of what it promises.
    const DecodedSound& sound() const { return sound_; }
    bool isWhole() const { return isWhole_; }
    /// Of FILE's frames at the output's rate, the first of the output.
    std::uint64_t start() const { return start_; }
    /// How many frames become one second, there and here.
    double sourceRate() const { return sourceRate_; }
    /// What is not as it was asked for, in words.
    const std::vector<std::string>& notes() const { return notes_; }

    /// The next samples, as a file of the format holds them; none at the end.
    std::string_view read();
    /// Samples so far that were beyond full scale, and stand at it now.
    std::int64_t clippedSamples() const { return clipped_; }

    /// Of FILE's frames that were read, those that could not be decoded: silence stands for them.
    std::uint64_t missingFrames() const { return reader_->missingFrames(); }
    /// All of it was read, and it is not what FILE's checksum says.
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
