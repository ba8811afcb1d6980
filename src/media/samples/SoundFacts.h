// What a file says of its sound beside how it is coded.
#pragma once

#include <cstdint>

namespace platform {

/// The kinds of a coding that decoders of it tell apart: of AAC the audio object types of ISO/IEC 14496-3.
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

struct SoundFacts {
    /// Which speakers the channels feed, as bits of the channel mask of extensible WAVE; 0 when the file does not say.
    std::uint32_t speakers = 0;
    CodingProfile profile = CodingProfile::unknown;
    /// Tracks of audio, of which the first is the one that is described and decoded.
    std::uint32_t tracks = 1;
    /// Frames that the headers promise; 0 where they promise none. A file with fewer is not whole.
    std::uint64_t promisedFrames = 0;
    /// Of 1-bit sound (DSD), which decodes to PCM of another rate: its own rate in hertz; else 0.
    std::uint64_t bitstreamRate = 0;
};

} // namespace platform
