// Frames of a file, as the spans that they make.
#pragma once

#include <cstdint>
#include <vector>

namespace platform::ffmpeg {

/// Apart, and in order. Each frame counts once, however often it is added.
class FrameSpans {
public:
    /// From `start` on, to ahead of `end`.
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
