// Sample rate conversion, as implemented by a decoder module.
#pragma once

#include <cstdint>

namespace platform {

/// Turns interleaved 32-bit floats of one sample rate into those of another; both rates are whole hertz. Output frame n
/// has the time of input frame n x from / to, counted from the first frame taken after the last reset(). The end is not
/// signalled: callers who want the last frames add silence. Modules implement it, so everything here is inline or pure.
/// Operations return 0 or a negative status.
class Resampler {
public:
    static constexpr std::uint32_t kMaxRate = 768000; // hertz, of either side
    static constexpr std::uint32_t kMaxChannels = 64;

    Resampler() = default;
    virtual ~Resampler() = default;
    Resampler(const Resampler&) = delete;
    Resampler& operator=(const Resampler&) = delete;

    /// How many input frames on either side of its time an output frame depends on, at most. What precedes the first
    /// frame taken is undefined, so output within its reach is useless.
    virtual std::uint32_t reach() const = 0;
    /// Forgets all input: the next frame taken is number 0.
    virtual std::int32_t reset() = 0;
    /// Takes `taken` input frames, which may be 0; produces up to `made` output frames and sets it to their number. If
    /// it produces fewer, it needs more input; input ahead of the output is kept. Allocates nothing after its first
    /// run.
    virtual std::int32_t convert(const float* from, std::uint32_t taken, float* to, std::uint32_t& made) = 0;
};

} // namespace platform
