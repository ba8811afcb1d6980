// The outputs of `ktfiles decode`: linear PCM in a WAVE, AIFF or CAF file, or raw.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "media/userdata/AudioFileService.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

struct DecodeFormat {
    const char* name; // on the command line; the extension of new files
    FourCC fileType;  // 0: raw samples, as in WAVE
};

/// All formats; the first is the default.
std::span<const DecodeFormat> decodeFormats();
/// Null for an unknown name.
const DecodeFormat* decodeFormatNamed(std::string_view name);
/// The format of a file name's extension; the default without an extension, null for an unknown one.
const DecodeFormat* decodeFormatOf(const std::string& path);

/// Sample depth: 8, 16, 24 or 32 bits; floats have 32 or 64.
struct SampleDepth {
    int bits = 16;
    bool isFloat = false;
};
/// "16-bit", "32-bit float"
std::string depthText(SampleDepth depth);

/// The sound of one output.
struct DecodedSound {
    double sampleRate = 0;
    std::uint32_t channels = 0;
    SampleDepth depth;
    std::int64_t frames = 0;
    TAudioBusFormat busFormat = kAudioBusUndefined;

    std::int64_t bytesPerFrame() const { return static_cast<std::int64_t>(channels) * (depth.bits / 8); }
    std::int64_t bytes() const { return frames * bytesPerFrame(); }
};

/// How a file of the format stores the samples.
platform::StreamDescription streamOf(const DecodedSound& sound, const DecodeFormat& format);

/// What precedes and follows the samples. Made for a number of frames that is known in advance, so that the output need
/// not be rewound; `of` a smaller number is equally long.
class DecodeFrame {
public:
    /// `chunks` are complete and precede the samples. Throws Failure if the format cannot hold the sound.
    DecodeFrame(const DecodedSound& sound, const DecodeFormat& format, Bytes chunks = {});

    std::string header(std::int64_t frames) const;
    /// A pad byte if the container needs one.
    std::string trailer(std::int64_t frames) const;
    /// "WAVE", "RF64", "AIFF", "AIFC", "CAF" or "raw".
    std::string container() const;

private:
    DecodedSound sound_;
    FourCC fileType_;
    Bytes chunks_;
    bool reservesRoom_ = false; // for RF64, which a WAVE file above 4 GiB becomes
};
