// Where the frames of a stream stand that has no table of them: each frame begins with a header that tells its length,
// so that one leads to the next (MP3, ADTS). Found as far as somebody asks, and kept.
#pragma once

#include "media/packets/PacketFile.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <vector>

namespace platform {

/// Bytes that are no frame are passed over, an ID3v2 tag by its size, up to 1 MiB in a run: where there are more, the
/// sound ends. A frame that the file cuts off is none. 8 bytes of memory for each frame found: 1.1 MB for an hour of
/// MP3 at 44.1 kHz.
class FrameIndex {
public:
    static constexpr std::size_t kHeaderSize = 7; // bytes that a header is judged by; no frame has fewer
    static constexpr std::size_t kLargestFrame = 8192;

    /// The length of a frame, its header included, by the first kHeaderSize bytes of it; 0 when there is no frame of
    /// this stream. The first byte of a frame is 0xFF.
    using Measure = std::function<std::uint32_t(const std::byte* header)>;

    struct Place {
        std::uint64_t position = 0;
        std::uint32_t size = 0;
    };

    /// The frames between two places of the file, which outlives this.
    FrameIndex(PacketFile& file, std::uint64_t start, std::uint64_t end, Measure measure);

    /// kStatusEndOfFile when there are not as many.
    std::int32_t find(std::uint64_t frame, Place& place);
    /// Finds all of them.
    std::int32_t count(std::uint64_t& frames);
    /// Where a frame that find() found begins.
    std::uint64_t position(std::uint64_t frame) const { return positions_[frame]; }

private:
    /// Finds one more frame; kStatusEndOfFile when there is none.
    std::int32_t step();
    /// The size of the frame at `bytes`, which reach to the end of the stream or far enough; 0 if there is none.
    std::uint32_t frameAt(BytesView bytes) const;
    bool skipTag();
    bool skipJunk();

    PacketFile& file_;
    std::uint64_t end_;
    Measure measure_;
    std::uint64_t next_; // where the frame after the last one found is looked for
    bool isComplete_ = false;
    std::vector<std::uint64_t> positions_;
};

} // namespace platform
