// The sums of products over a bank of filters, on which resampling spends its time.
#pragma once

#include <cstddef>
#include <cstdint>

namespace platform {

/// A run of frames to make with a bank of filters, one for each position of an output frame between two input frames.
struct PolyphaseRun {
    /// A filter's length is a multiple of this. That many partial sums run side by side and are added last, in the same
    /// order on every processor.
    static constexpr std::size_t kSideBySide = 16;

    const float* filters = nullptr; // `phases` of `taps` coefficients
    std::size_t taps = 0;
    std::size_t phases = 0;
    std::size_t step = 0; // from one output frame to the next, in phases
    std::size_t phase = 0;
    const float* samples = nullptr; // under the first coefficient; channel after channel, `stride` apart
    std::size_t stride = 0;
    std::size_t channels = 0;
    float* to = nullptr; // interleaved
    std::size_t frames = 0;

    /// Moves on by one frame.
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

/// Makes the frames, with vectors if the processor has them.
void runPolyphase(PolyphaseRun run);
/// As above, without vectors.
void runPolyphasePlain(PolyphaseRun run);
/// The same by the vectors of AVX2, and by those of AVX-512, which hold all sums of a channel. Only for x86-64, where
/// hasFastRoads and hasWiderRoads (media/samples/SampleRoads.h) say that the processor has them.
void runPolyphaseFast(PolyphaseRun run);
void runPolyphaseWider(PolyphaseRun run);

} // namespace platform
