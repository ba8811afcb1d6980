// How audio data is coded.
#pragma once

#include "media/samples/SampleConversion.h"
#include "platform/core/FourCC.h"

#include <cstdint>

namespace platform {

/// How audio data is coded: 40 bytes in host order. A field that a coding does not fix is 0.
struct KT_EXPORT StreamDescription {
    /// Bits of formatFlags.
    enum Flag : std::uint32_t { isFloat = 1, isBigEndian = 2, isSignedInteger = 4, isPacked = 8 };
    static constexpr FourCC linearPCM = fourCC("lpcm"); // the formatId of linear PCM

    double sampleRate = 0; // hertz
    FourCC formatId = 0;   // "lpcm", "alaw", "ulaw", "ima4", …; "ms" and the 16-bit tag for other WAVE codings
    std::uint32_t formatFlags = 0;      // of Flag, for linear PCM
    std::uint32_t bytesPerPacket = 0;   // 0: packets differ in size
    std::uint32_t framesPerPacket = 0;  // 1 for linear PCM
    std::uint32_t bytesPerFrame = 0;    // 0 for compressed data
    std::uint32_t channelsPerFrame = 0; // interleaved
    std::uint32_t bitsPerChannel = 0;   // 0 for compressed data
    std::uint32_t reserved = 0;         // always 0

    /// Whether the data is linear PCM.
    bool isLinearPCM() const { return formatId == linearPCM; }
    /// How one sample is stored; only for linear PCM, and isSupported() must still be asked.
    SampleFormat sampleFormat() const;
    /// Linear PCM of packed samples; 8-bit little-endian integers are unsigned, as in WAVE, all others signed.
    static StreamDescription packedPCM(double sampleRate, std::uint32_t channels, SampleFormat sample);
    friend bool operator==(const StreamDescription&, const StreamDescription&) = default;
};
static_assert(sizeof(StreamDescription) == 40);

} // namespace platform
