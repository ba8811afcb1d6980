// Where the sound of a Musepack file begins and ends, which its packets do not tell. Published source: the format
// description of stream version 8 by the coding's makers.
#pragma once

#include <cstdint>
#include <optional>

namespace platform::ffmpeg {

class Demuxer;

struct MusepackInfo {
    std::uint64_t lead = 0;   // frames that decoding gives ahead of the first: the filter bank's delay, and silence
    std::uint64_t frames = 0; // at least 1
};

/// Of a file of stream version 8, a tag ahead of it or not; none for others, and where the header does not say. 0, or
/// the status of a read that failed.
std::int32_t readMusepackInfo(Demuxer& demuxer, std::optional<MusepackInfo>& info);

} // namespace platform::ffmpeg
