// The frames of a FLAC file (RFC 9639), found by their headers one behind the other, which takes a tenth of the time
// that FFmpeg's parser takes: that one also reckons the checksum of each frame, which its decoder does again.
#pragma once

#include "media/packets/FLACFrame.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

struct AVIOContext;
struct AVPacket;

namespace platform::ffmpeg {

/// Only files in which each header tells the number that follows from the one before: at anything else it stops, for
/// others to go on there. What is in a frame is not looked at, but for the last.
class FLACFrames {
public:
    /// From the place in the file where the first frame begins. `streamInfo` is that metadata block. None where it says
    /// too little.
    static std::optional<FLACFrames> from(std::int64_t place, std::span<const std::uint8_t> streamInfo);

    enum class Result : std::uint8_t { packet, end, stopped };
    /// The next frame, its time being the number of its first sample. Memory that is not to be had throws
    /// std::bad_alloc; a file that cannot be read stops.
    Result read(AVIOContext& file, AVPacket& packet);

    /// The number of the first sample that was not read yet.
    std::int64_t next() const { return static_cast<std::int64_t>(next_); }

private:
    std::optional<FLACFrame> nextAt(std::size_t offset) const;
    bool fill(AVIOContext& file, std::size_t count);
    std::size_t findNext(std::size_t from) const;

    std::int64_t place_ = 0; // of the buffer's first byte, in the file
    std::vector<std::uint8_t> buffer_;
    std::size_t begin_ = 0;       // of the next frame in the buffer
    bool isAtEnd_ = false;        // the file has no more bytes than the buffer
    std::uint32_t blockSize_ = 0; // of all but the last
    std::size_t shortest_ = 0;    // frames; 0: not known
    std::uint64_t next_ = 0;
    std::optional<FLACFrame> last_;
};

} // namespace platform::ffmpeg
