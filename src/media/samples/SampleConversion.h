// Conversion of linear PCM samples between their stored form and 32-bit floats.
#pragma once

#include "platform/core/Export.h"

#include <bit>
#include <cstddef>
#include <cstdint>

namespace platform {

/// How one sample is stored. Bits are 8, 16, 24 or 32 for integers, 32 or 64 for floats.
struct SampleFormat {
    int bits = 16;                           // of one sample; 8, 16, 24, 32 or 64
    bool isFloat = false;                    // else integers
    bool isUnsigned = false;                 // 8-bit WAVE, AIFC "raw "
    std::endian order = std::endian::little; // of samples of more than 8 bits

    /// How many bytes a sample takes.
    int bytesPerSample() const { return (bits + 7) / 8; }
    /// Whether the library reads and writes such samples.
    bool isSupported() const
    {
        return isFloat ? bits == 32 || bits == 64 : bits == 8 || bits == 16 || bits == 24 || bits == 32;
    }
    friend bool operator==(const SampleFormat&, const SampleFormat&) = default;
};

/// `count` samples to floats: integers divided by 2^(bits-1), so that full scale is [-1, 1); floats as they are.
/// `samples` needs no alignment. The format must be supported.
KT_EXPORT void samplesToFloat(const void* samples, SampleFormat format, float* to, std::size_t count);

/// `count` floats to samples: integers are rounded half to even and clamped to full scale; a NaN becomes 0. Integers
/// that came from samplesToFloat come back unchanged (32-bit ones to the 24 bits that a float holds).
KT_EXPORT void floatToSamples(const float* from, SampleFormat format, void* samples, std::size_t count);

/// Reverses the bytes of each of `count` samples of 1 to 4, or 8, bytes, in place; `samples` needs no alignment.
KT_EXPORT void swapSamples(void* samples, int bytesPerSample, std::size_t count);

/// The conversion without vector instructions, which the fast one must equal.
KT_EXPORT void samplesToFloatPlain(const void* samples, SampleFormat format, float* to, std::size_t count);
/// The conversion without vector instructions, which the fast one must equal.
KT_EXPORT void floatToSamplesPlain(const float* from, SampleFormat format, void* samples, std::size_t count);

} // namespace platform
