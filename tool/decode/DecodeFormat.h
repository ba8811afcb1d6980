// What `ktfiles decode` writes: linear PCM in a WAVE, AIFF or CAF file, or bare.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "media/userdata/AudioFileService.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

struct DecodeFormat {
    const char* name; // on the command line; the extension of new files
    FourCC fileType;  // 0: bare samples, as in WAVE
};

/// All of them; the first is the usual one.
std::span<const DecodeFormat> decodeFormats();
/// Null for an unknown name.
const DecodeFormat* decodeFormatNamed(std::string_view name);
/// The format that the extension of a file name means; the usual one for a name without extension, null for another.
const DecodeFormat* decodeFormatOf(const std::string& path);

/// How deep samples are: 8, 16, 24 or 32 bits, floats 32 or 64.
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

/// How the sound's samples stand in a file of the format.
platform::StreamDescription streamOf(const DecodedSound& sound, const DecodeFormat& format);

/// What lies ahead of the samples and behind them. Made for a number of frames that is known from the start, so that
/// the output need not be gone back to; when fewer came after all, `of` them is as long.
class DecodeFrame {
public:
    /// `chunks` go ahead of the samples, whole. Throws Failure when the format cannot hold such a sound.
    DecodeFrame(const DecodedSound& sound, const DecodeFormat& format, Bytes chunks = {});

    std::string header(std::int64_t frames) const;
    /// A pad byte where the container wants one.
    std::string trailer(std::int64_t frames) const;
    /// "WAVE", "RF64", "AIFF", "AIFC", "CAF" or "raw".
    std::string container() const;

private:
    DecodedSound sound_;
    FourCC fileType_;
    Bytes chunks_;
    bool reservesRoom_ = false; // to be RF64, which a WAVE file of more than 4 GiB is
};
