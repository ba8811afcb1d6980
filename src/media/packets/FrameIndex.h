// Positions of the frames in a stream without a table, where each frame's header tells its length and so leads to the
// next (MP3, ADTS). Frames are found as far as they are asked for, and kept.
#pragma once

#include "media/packets/PacketFile.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <vector>

namespace platform {

/// Skips bytes that are no frame, and an ID3v2 tag by its size; after 1 MiB of them in a run the sound ends. A frame
/// that the file cuts off does not count. Each frame found takes 8 bytes of memory: 1.1 MB for an hour of MP3 at 44.1
/// kHz.
class FrameIndex {
public:
    static constexpr std::size_t kHeaderSize = 7; // bytes that identify a header; no frame is shorter
    static constexpr std::size_t kLargestFrame = 8192;

    /// Length of a frame with its header, from its first kHeaderSize bytes; 0 if they begin no frame of this stream.
    /// The first byte of a frame is 0xFF.
    using Measure = std::function<std::uint32_t(const std::byte* header)>;

    struct Place {
        std::uint64_t position = 0;
        std::uint32_t size = 0;
    };

    /// The frames between two positions of the file, which outlives this.
    FrameIndex(PacketFile& file, std::uint64_t start, std::uint64_t end, Measure measure);

    /// kStatusEndOfFile if there are not that many.
    std::int32_t find(std::uint64_t frame, Place& place);
    /// Finds all frames.
    std::int32_t count(std::uint64_t& frames);
    /// Position of a frame that find() has found.
    std::uint64_t position(std::uint64_t frame) const { return positions_[frame]; }

private:
    /// Finds one more frame; kStatusEndOfFile if there is none.
    std::int32_t step();
    /// Size of the frame at `bytes`, which reach far enough or to the end of the stream; 0 if there is none.
    std::uint32_t frameAt(BytesView bytes) const;
    bool skipTag();
    bool skipJunk();

    PacketFile& file_;
    std::uint64_t end_;
    Measure measure_;
    std::uint64_t next_; // where the search for the next frame begins
    bool isComplete_ = false;
    std::vector<std::uint64_t> positions_;
};

} // namespace platform
