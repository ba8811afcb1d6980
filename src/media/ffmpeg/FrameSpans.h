// A set of frames, kept as spans.
#pragma once

#include <cstdint>
#include <vector>

namespace platform::ffmpeg {

/// Disjoint and sorted. Each frame counts once, however often it is added.
class FrameSpans {
public:
    /// Adds the frames [start, end).
    void add(std::uint64_t start, std::uint64_t end);
    std::uint64_t count() const { return count_; }

private:
    struct Span {
        std::uint64_t start, end;
    };
    std::vector<Span> all_;
    std::uint64_t count_ = 0;
};

} // namespace platform::ffmpeg
