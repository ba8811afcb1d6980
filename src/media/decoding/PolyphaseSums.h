// The sums of products that a bank of filters makes of samples: what resampling spends its time on.
#pragma once

#include <cstddef>
#include <cstdint>

namespace platform {

/// Frames to be made by a bank of filters, one for each place that an output frame can have between two input frames.
struct PolyphaseRun {
    /// A filter's length is a multiple of this, and so many sums run side by side: they are added up at last, in the
    /// same order on every processor.
    static constexpr std::size_t kSideBySide = 16;

    const float* filters = nullptr; // `phases` of `taps` coefficients
    std::size_t taps = 0;
    std::size_t phases = 0;
    std::size_t step = 0; // from one output frame to the next, in phases
    std::size_t phase = 0;
    const float* samples = nullptr; // under the first coefficient; of each channel by itself, `stride` apart
    std::size_t stride = 0;
    std::size_t channels = 0;
    float* to = nullptr; // interleaved
    std::size_t frames = 0;

    /// Goes on by one frame.
    void next()
    {
        phase += step % phases;
        samples += step / phases;
        if (phase >= phases) {
            phase -= phases;
            ++samples;
        }
    }
};

/// Makes the frames, by vectors where the processor has them.
void runPolyphase(PolyphaseRun run);
/// The same, plainly.
void runPolyphasePlain(PolyphaseRun run);

} // namespace platform
