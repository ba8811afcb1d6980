// Sample rate conversion, as a decoder module does it.
#pragma once

#include <cstdint>

namespace platform {

/// Turns interleaved 32-bit floats of one sample rate into those of another; both rates are whole hertz. Output frame n
/// stands at the time of input frame n x from / to, counted from the first frame taken after the last reset(). An end
/// is not told: whoever wants the last frames lets silence follow. A module implements it, so that everything here is
/// inline or pure. Operations return 0 or a negative status.
class Resampler {
public:
    static constexpr std::uint32_t kMaxRate = 768000; // hertz, of either side
    static constexpr std::uint32_t kMaxChannels = 64;

    Resampler() = default;
    virtual ~Resampler() = default;
    Resampler(const Resampler&) = delete;
    Resampler& operator=(const Resampler&) = delete;

    /// How many input frames on either side of its time an output frame depends on, at most. What precedes the first
    /// frame taken is not defined: output within reach of it is of no use.
    virtual std::uint32_t reach() const = 0;
    /// Forgets what was taken: the next frame taken is number 0.
    virtual std::int32_t reset() = 0;
    /// Takes `taken` input frames, which may be none; gives `made` output frames at most, and sets it to their number.
    /// Fewer say that more input is needed; input that is ahead of the output is kept. Allocates nothing once it has
    /// run.
    virtual std::int32_t convert(const float* from, std::uint32_t taken, float* to, std::uint32_t& made) = 0;
};

} // namespace platform
