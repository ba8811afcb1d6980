// Loudness and true peak of sound by EBU R 128 (ITU-R BS.1770-4, EBU Tech 3341 and 3342).
#pragma once

#include "platform/core/Error.h"
#include "platform/core/Export.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>

namespace platform {

/// The measures of a sound. A value without a number is null: for silence, and for sound that is too short for it.
struct Loudness {
    std::optional<double> integrated;   ///< of all but the quiet parts (gated), in LUFS; of 400 ms at least
    std::optional<double> range;        ///< in LU, by the short-term loudness of each 100 ms; of 3 s at least
    std::optional<double> maxTruePeak;  ///< of all channels, in dBTP
    std::optional<double> maxMomentary; ///< of any window of 400 ms, ten windows a second, in LUFS
    std::optional<double> maxShortTerm; ///< of any 3 s, the same way
};

/// Measures sound that is added in pieces.
class LoudnessMeter {
public:
    static constexpr std::uint32_t kMostChannels = 64, // of one sound
        kLowestRate = 16,                              // in Hz
        kHighestRate = 2'822'400;                      // in Hz

    virtual ~LoudnessMeter() = default;
    /// Adds interleaved frames, full scale being 1. kStatusOK, kStatusOutOfMemory, or kStatusParameterError for
    /// samples that are not numbers, after which nothing is measured.
    virtual std::int32_t add(const float* samples, std::size_t frames) = 0;
    /// The measures of everything added so far.
    virtual Loudness measured() const = 0;
};

/// Up to 64 channels, 16 to 2,822,400 frames a second. `speakers` are those that the channels feed, in the order of the
/// bits of WAVE's channel mask: surrounds count by 1.41, low-frequency effects not at all. Where they are 0, or not one
/// for each channel, it is mono, stereo, L R C, L R Ls Rs, L R C Ls Rs, 5.1, or 7.1 in WAVE's order. Null with `status`
/// kStatusParameterError for more channels whose places are not known, and rates and numbers of channels beyond those;
/// with AudioHandle::kFormatNotSupported without the module "ktfiles/libktfiles-loudness.so" beside the library. Then
/// `error` (which may be null) says what is wrong in words, or names what to install.
KT_EXPORT std::unique_ptr<LoudnessMeter> makeLoudnessMeter(std::uint32_t channels, std::uint32_t sampleRate,
                                                           std::uint32_t speakers, std::int32_t& status,
                                                           Error* error = nullptr);

/// What the module exports as "ktfiles_loudnessModule". Its function throws nothing; null means out of memory.
struct LoudnessModule {
    static constexpr std::uint32_t currentVersion = 1; // of this struct and of the meter; another is not used

    std::uint32_t version; // as currentVersion when the module was built
    /// Makes a meter; `speakers` has a bit for each channel.
    LoudnessMeter* (*make)(std::uint32_t channels, std::uint32_t sampleRate, std::uint32_t speakers);
};

} // namespace platform
