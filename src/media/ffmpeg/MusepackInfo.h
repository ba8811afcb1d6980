// Where the sound of a Musepack file begins and ends, which its packets do not tell. Published source: the format
// description of stream version 8 by the coding's authors.
#pragma once

#include <cstdint>
#include <optional>

namespace platform::ffmpeg {

class Demuxer;

struct MusepackInfo {
    std::uint64_t lead = 0;   // frames decoded before the first: the filter bank's delay, and silence
    std::uint64_t frames = 0; // at least 1
};

/// Reads a file of stream version 8, with or without a tag before it; none for others, and if the header does not tell.
/// 0, or the status of a failed read.
std::int32_t readMusepackInfo(Demuxer& demuxer, std::optional<MusepackInfo>& info);

} // namespace platform::ffmpeg
