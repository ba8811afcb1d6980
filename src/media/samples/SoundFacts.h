// What a file says about its sound besides its coding.
#pragma once

#include <cstdint>

namespace platform {

/// The kinds of a coding that its decoders tell apart; for AAC the audio object types of ISO/IEC 14496-3.
enum class CodingProfile : std::int32_t {
    unknown = 0,
    aacMain = 1,
    aacLC = 2,
    aacSSR = 3,
    aacLTP = 4,
    heAAC = 5,
    aacLD = 23,
    heAACv2 = 29,
    aacELD = 39,
    xHEAAC = 42,
    dtsES = 0x100,
    dts9624 = 0x101,
    dtsHDHighResolution = 0x102,
    dtsHDMaster = 0x103,
    dtsExpress = 0x104,
};

/// What a file says about its sound besides its coding.
struct SoundFacts {
    /// The speakers that the channels feed, as bits of the channel mask of extensible WAVE; 0 when the file does not
    /// say.
    std::uint32_t speakers = 0;
    CodingProfile profile = CodingProfile::unknown; // of the coding
    /// How many audio tracks there are; the first is described and decoded.
    std::uint32_t tracks = 1;
    /// How many frames the headers promise; 0 where they promise none. A file with fewer is not whole.
    std::uint64_t promisedFrames = 0;
    /// For 1-bit sound (DSD), which decodes to PCM of another rate: its own rate in hertz; else 0.
    std::uint64_t bitstreamRate = 0;
};

} // namespace platform
