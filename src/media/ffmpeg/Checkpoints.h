// Packets whose frames' numbers are known because everything ahead of them was decoded once: for files whose times are
// too coarse to tell.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace platform::ffmpeg {

struct Checkpoint {
    std::int64_t time = 0;     // of the packet
    std::int64_t position = 0; // in the file; negative when it is not known
    std::uint64_t frame = 0;   // the number of the first frame that comes out once it is sent
};

/// In the order of the file, and a bounded number of them: when they become many, every other one goes.
class Checkpoints {
public:
    /// Keeps it when it is far enough behind the last.
    void offer(const Checkpoint& checkpoint);
    /// The one of this packet; null when it is none.
    const Checkpoint* find(std::int64_t time, std::int64_t position) const;
    /// How many lie at or before a frame.
    std::size_t countUpTo(std::uint64_t frame) const;
    const Checkpoint& operator[](std::size_t index) const { return all_[index]; }

private:
    std::vector<Checkpoint> all_;
    std::uint64_t interval_ = 16384;
};

} // namespace platform::ffmpeg
