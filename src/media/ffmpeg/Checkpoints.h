// Packets whose frame numbers are known because everything before them was decoded once; for files whose timestamps are
// too coarse to number frames.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace platform::ffmpeg {

struct Checkpoint {
    std::int64_t time = 0;     // of the packet
    std::int64_t position = 0; // in the file; negative if unknown
    std::uint64_t frame = 0;   // number of the first frame that comes out after it is sent
};

/// In file order and bounded in number: when there are too many, every other one is dropped.
class Checkpoints {
public:
    /// Keeps it if it is far enough after the last.
    void offer(const Checkpoint& checkpoint);
    /// The checkpoint of this packet; null if it has none.
    const Checkpoint* find(std::int64_t time, std::int64_t position) const;
    /// Number of checkpoints at or before a frame.
    std::size_t countUpTo(std::uint64_t frame) const;
    const Checkpoint& operator[](std::size_t index) const { return all_[index]; }

private:
    std::vector<Checkpoint> all_;
    std::uint64_t interval_ = 16384;
};

} // namespace platform::ffmpeg
